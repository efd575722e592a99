#pragma once

#include <cstdint>
#include <vector>

namespace tarn {

/// Bytes that someone owns. "No data" is std::nullopt or an absent optional, never an empty Data.
using Data = std::vector<std::uint8_t>;

} // namespace tarn
