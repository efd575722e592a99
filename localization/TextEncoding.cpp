#include "localization/TextEncoding.h"

#include "wire/Utf8.h"

namespace tarn {

namespace {

constexpr std::string_view utf8Mark = "\xEF\xBB\xBF";
constexpr std::string_view utf16LittleMark = "\xFF\xFE";
constexpr std::string_view utf16BigMark = "\xFE\xFF";

std::optional<std::string> decodeUtf16(std::string_view bytes, bool isBigEndian) {
    if (bytes.size() % 2 != 0)
        return std::nullopt;
    std::string text;
    Utf16Joiner joiner;
    for (std::size_t index = 0; index < bytes.size(); index += 2) {
        const unsigned first = static_cast<unsigned char>(bytes[index]);
        const unsigned second = static_cast<unsigned char>(bytes[index + 1]);
        if (!joiner.add(static_cast<char16_t>(isBigEndian ? first << 8 | second : second << 8 | first), text))
            return std::nullopt;
    }
    return joiner.isPending() ? std::nullopt : std::optional(std::move(text));
}

} // namespace

void appendUtf8(std::string& out, char32_t character) {
    const auto continuation = [&](int shift) {
        out += static_cast<char>(0x80 | ((character >> shift) & 0x3F));
    };
    if (character < 0x80) {
        out += static_cast<char>(character);
    } else if (character < 0x800) {
        out += static_cast<char>(0xC0 | (character >> 6));
        continuation(0);
    } else if (character < 0x10000) {
        out += static_cast<char>(0xE0 | (character >> 12));
        continuation(6);
        continuation(0);
    } else {
        out += static_cast<char>(0xF0 | (character >> 18));
        continuation(12);
        continuation(6);
        continuation(0);
    }
}

bool Utf16Joiner::add(char16_t unit, std::string& out) {
    const bool isHigh = unit >= 0xD800 && unit < 0xDC00;
    const bool isLow = unit >= 0xDC00 && unit < 0xE000;
    if (isLow != isPending())
        return false;
    if (isHigh) {
        high_ = unit;
    } else if (isLow) {
        appendUtf8(out, 0x10000 + ((high_ - 0xD800U) << 10) + (unit - 0xDC00U));
        high_ = 0;
    } else {
        appendUtf8(out, unit);
    }
    return true;
}

std::optional<std::string> decodeText(std::string_view bytes) {
    if (bytes.starts_with(utf16LittleMark))
        return decodeUtf16(bytes.substr(2), false);
    if (bytes.starts_with(utf16BigMark))
        return decodeUtf16(bytes.substr(2), true);
    if (bytes.starts_with(utf8Mark))
        bytes.remove_prefix(utf8Mark.size());
    return isValidUtf8(bytes) ? std::optional(std::string(bytes)) : std::nullopt;
}

} // namespace tarn
