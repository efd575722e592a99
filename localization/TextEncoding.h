#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace tarn {

/// Appends the UTF-8 form of a character that is no surrogate.
void appendUtf8(std::string& out, char32_t character);

/// The text of a file in UTF-8, or in UTF-16 with a byte order mark, as UTF-8 without a mark. None when it is
/// not well-formed.
std::optional<std::string> decodeText(std::string_view bytes);

/// Joins UTF-16 units to characters.
class Utf16Joiner {
public:
    /// Appends the character that `unit` completes; false when the unit cannot stand here.
    bool add(char16_t unit, std::string& out);

    /// True between the two halves of a character.
    bool isPending() const { return high_ != 0; }

private:
    char16_t high_ = 0;
};

} // namespace tarn
