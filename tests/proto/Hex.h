#pragma once

#include <string>
#include <string_view>

#include "roles/Data.h"

namespace tarn {

/// "0A 01 61" as bytes.
inline Data bytesFromHex(std::string_view hex) {
    Data bytes;
    for (std::size_t index = 0; index + 1 < hex.size(); index += 3)
        bytes.push_back(
            static_cast<std::uint8_t>(std::stoul(std::string(hex.substr(index, 2)), nullptr, 16)));
    return bytes;
}

} // namespace tarn
