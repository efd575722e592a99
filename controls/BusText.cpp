#include "controls/BusText.h"

#include "wire/Utf8.h"

namespace tarn {

namespace {

constexpr std::string_view replacement = "\xef\xbf\xbd"; // U+FFFD

bool isControl(char32_t character) {
    return character < 0x20 || (character >= 0x7f && character < 0xa0) || character == 0x2028 ||
           character == 0x2029;
}

/// Some implementations of the bus refuse these, although they are well-formed.
bool isNoncharacter(char32_t character) {
    return (character & 0xfffe) == 0xfffe || (character >= 0xfdd0 && character <= 0xfdef);
}

std::string_view shown(std::string_view character) {
    const char32_t value = utf8CharacterValue(character, character.size());
    if (isControl(value))
        return " ";
    return isNoncharacter(value) ? replacement : character;
}

} // namespace

std::string busText(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        const std::size_t length = utf8CharacterLength(text);
        const std::string_view piece = length == 0 ? replacement : shown(text.substr(0, length));
        if (result.size() + piece.size() > busTextLimit)
            break;
        result += piece;
        text.remove_prefix(length == 0 ? 1 : length);
    }
    return result;
}

} // namespace tarn
