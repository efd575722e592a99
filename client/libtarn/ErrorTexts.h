#pragma once

#include <cstdint>
#include <map>
#include <span>
#include <string>

namespace tarn {

/// The texts in a status's `errorDict`, a binary property list of one dictionary of texts. Entries of other
/// kinds are left out; bytes that are no such list give nothing.
std::map<std::string, std::string> readErrorTexts(std::span<const std::uint8_t> propertyList);

} // namespace tarn
