#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace tarn {

inline constexpr std::size_t busTextLimit = 1024;

/// A text that every bus takes and every widget can show on one line: well-formed UTF-8 of at most
/// `busTextLimit` bytes. Control characters, line breaks among them, become spaces; what is no character
/// becomes U+FFFD. A bus ends the connection of a sender whose text is not well-formed.
std::string busText(std::string_view text);

} // namespace tarn
