#pragma once

#include <cstddef>
#include <string_view>

namespace tarn {

/// Bytes of the well-formed UTF-8 character that `text` begins with; 0 when it begins with none. Overlong
/// forms, surrogates and values past U+10FFFF are not well-formed.
std::size_t utf8CharacterLength(std::string_view text) noexcept;

bool isValidUtf8(std::string_view text) noexcept;

/// The value of the character that `text` begins with, of a length that utf8CharacterLength() gave.
char32_t utf8CharacterValue(std::string_view text, std::size_t length) noexcept;

} // namespace tarn
