#include "localization/StringsFile.h"

#include <algorithm>
#include <charconv>
#include <string>

#include "localization/TextEncoding.h"

namespace tarn {

namespace {

constexpr std::string_view plainWordCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_$/:.-";

/// Walks through the text once. Each operation returns false, or none, at something that cannot be read; the
/// walk is over then.
class StringsParser {
public:
    explicit StringsParser(std::string_view text) : rest_(text) {}

    std::optional<Bundle::Strings> parse() {
        Bundle::Strings strings;
        while (true) {
            if (!skipBlanks())
                return std::nullopt;
            if (rest_.empty())
                return strings;
            if (!parseEntry(strings))
                return std::nullopt;
        }
    }

private:
    bool parseEntry(Bundle::Strings& strings) {
        auto key = parseText();
        if (!key || !skipBlanks())
            return false;
        std::optional<std::string> text = key;
        if (take("=")) {
            if (!skipBlanks())
                return false;
            text = parseText();
            if (!text || !skipBlanks())
                return false;
        }
        if (!take(";"))
            return false;
        strings.insert_or_assign(std::move(*key), std::move(*text));
        return true;
    }

    std::optional<std::string> parseText() {
        if (take("\""))
            return parseQuoted('"');
        if (take("'"))
            return parseQuoted('\'');
        const std::size_t size = std::min(rest_.find_first_not_of(plainWordCharacters), rest_.size());
        if (size == 0)
            return std::nullopt;
        return std::string(takeFront(size));
    }

    std::optional<std::string> parseQuoted(char quote) {
        std::string text;
        while (!rest_.empty()) {
            const char next = takeFront(1).front();
            const bool isUnit = next == '\\' && startsUnitEscape();
            if (halves_.isPending() && !isUnit)
                return std::nullopt;
            if (next == quote)
                return text;
            if (next != '\\')
                text += next;
            else if (!parseEscape(text))
                return std::nullopt;
        }
        return std::nullopt;
    }

    bool startsUnitEscape() const { return rest_.starts_with('U') || rest_.starts_with('u'); }

    bool parseEscape(std::string& text) {
        constexpr std::string_view letters = "abfnrtv";
        constexpr std::string_view meanings = "\a\b\f\n\r\t\v";
        if (rest_.empty())
            return false;
        if (startsUnitEscape()) {
            rest_.remove_prefix(1);
            const auto unit = takeNumber(4, 16);
            return unit && halves_.add(*unit, text);
        }
        if (const auto character = takeNumber(3, 8)) {
            appendUtf8(text, *character);
            return true;
        }
        const char letter = takeFront(1).front();
        const std::size_t index = letters.find(letter);
        text += index == letters.npos ? letter : meanings[index];
        return true;
    }

    std::optional<char16_t> takeNumber(std::size_t digits, int base) {
        unsigned value = 0;
        const char* begin = rest_.data();
        const char* end = begin + std::min(digits, rest_.size());
        const auto result = std::from_chars(begin, end, value, base);
        if (result.ptr == begin)
            return std::nullopt;
        rest_.remove_prefix(static_cast<std::size_t>(result.ptr - begin));
        return static_cast<char16_t>(value);
    }

    /// Skips white space and comments; false in a comment without an end.
    bool skipBlanks() {
        while (true) {
            rest_.remove_prefix(std::min(rest_.find_first_not_of(" \t\r\n\f\v"), rest_.size()));
            if (take("//")) {
                rest_.remove_prefix(std::min(rest_.find_first_of("\r\n"), rest_.size()));
            } else if (take("/*")) {
                const std::size_t end = rest_.find("*/");
                if (end == rest_.npos)
                    return false;
                rest_.remove_prefix(end + 2);
            } else {
                return true;
            }
        }
    }

    bool take(std::string_view token) {
        if (!rest_.starts_with(token))
            return false;
        rest_.remove_prefix(token.size());
        return true;
    }

    std::string_view takeFront(std::size_t size) {
        const std::string_view front = rest_.substr(0, size);
        rest_.remove_prefix(size);
        return front;
    }

    std::string_view rest_;
    Utf16Joiner halves_;
};

} // namespace

std::optional<Bundle::Strings> parseStringsFile(std::string_view bytes) {
    const auto text = decodeText(bytes);
    return text ? StringsParser(*text).parse() : std::nullopt;
}

} // namespace tarn
