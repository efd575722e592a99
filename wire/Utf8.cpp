#include "wire/Utf8.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

namespace tarn {

namespace {

/// What the second byte may be after a given first byte; it alone rules out overlong forms and surrogates.
struct LeadByte {
    unsigned char first;
    unsigned char last;
    std::size_t length;
    unsigned char secondFirst;
    unsigned char secondLast;
};

constexpr std::array<LeadByte, 8> leadBytes{{{0xC2, 0xDF, 2, 0x80, 0xBF},
                                             {0xE0, 0xE0, 3, 0xA0, 0xBF},
                                             {0xE1, 0xEC, 3, 0x80, 0xBF},
                                             {0xED, 0xED, 3, 0x80, 0x9F},
                                             {0xEE, 0xEF, 3, 0x80, 0xBF},
                                             {0xF0, 0xF0, 4, 0x90, 0xBF},
                                             {0xF1, 0xF3, 4, 0x80, 0xBF},
                                             {0xF4, 0xF4, 4, 0x80, 0x8F}}};

unsigned char byteAt(std::string_view text, std::size_t index) {
    return static_cast<unsigned char>(text[index]);
}

constexpr std::size_t wordSize = sizeof(std::uint64_t);

std::uint64_t wordAt(const char* text) {
    std::uint64_t word = 0;
    std::memcpy(&word, text, wordSize);
    return word;
}

/// Looks at eight bytes at a time; the last eight may overlap those before.
bool isAscii(std::string_view text) {
    constexpr std::uint64_t highBits = 0x8080808080808080U;
    std::uint64_t seen = 0;
    if (text.size() < wordSize) {
        for (const char character : text)
            seen |= static_cast<unsigned char>(character);
        return (seen & highBits) == 0;
    }
    const char* const lastWord = text.data() + text.size() - wordSize;
    for (const char* position = text.data(); position < lastWord; position += wordSize)
        seen |= wordAt(position);
    return ((seen | wordAt(lastWord)) & highBits) == 0;
}

} // namespace

std::size_t utf8CharacterLength(std::string_view text) noexcept {
    if (text.empty())
        return 0;
    const unsigned char lead = byteAt(text, 0);
    if (lead < 0x80)
        return 1;
    const auto* row = std::ranges::find_if(leadBytes, [lead](const LeadByte& candidate) {
        return lead >= candidate.first && lead <= candidate.last;
    });
    if (row == leadBytes.end() || text.size() < row->length)
        return 0;
    if (byteAt(text, 1) < row->secondFirst || byteAt(text, 1) > row->secondLast)
        return 0;
    const auto rest = text.substr(2, row->length - 2);
    const bool continued = std::ranges::all_of(
        rest, [](char character) { return (static_cast<unsigned char>(character) & 0xC0) == 0x80; });
    return continued ? row->length : 0;
}

bool isValidUtf8(std::string_view text) noexcept {
    if (isAscii(text)) // nearly every text is
        return true;
    while (!text.empty()) {
        const std::size_t length = utf8CharacterLength(text);
        if (length == 0)
            return false;
        text.remove_prefix(length);
    }
    return true;
}

char32_t utf8CharacterValue(std::string_view text, std::size_t length) noexcept {
    constexpr std::array<unsigned, 5> leadBits{0, 0x7F, 0x1F, 0x0F, 0x07};
    char32_t value = byteAt(text, 0) & leadBits[length];
    for (std::size_t index = 1; index < length; ++index)
        value = (value << 6) | (byteAt(text, index) & 0x3FU);
    return value;
}

} // namespace tarn
