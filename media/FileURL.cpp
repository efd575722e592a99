#include "media/FileURL.h"

#include <algorithm>
#include <cctype>

namespace tarn {

namespace {

bool equalsIgnoringCase(std::string_view text, std::string_view lower) {
    return std::equal(text.begin(), text.end(), lower.begin(), lower.end(),
                      [](char a, char b) { return std::tolower(static_cast<unsigned char>(a)) == b; });
}

int hexDigit(char digit) {
    if (digit >= '0' && digit <= '9')
        return digit - '0';
    const int lower = std::tolower(static_cast<unsigned char>(digit));
    return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
}

std::optional<std::string> percentDecoded(std::string_view text) {
    std::string result;
    result.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        char character = text[i];
        if (character == '%') {
            const int high = i + 2 < text.size() ? hexDigit(text[i + 1]) : -1;
            const int low = i + 2 < text.size() ? hexDigit(text[i + 2]) : -1;
            if (high < 0 || low < 0)
                return std::nullopt;
            character = static_cast<char>(high * 16 + low);
            i += 2;
        }
        if (character == '\0')
            return std::nullopt;
        result += character;
    }
    return result;
}

} // namespace

std::optional<std::string> pathFromFileURL(std::string_view URL) {
    constexpr std::string_view scheme = "file:";
    if (URL.size() < scheme.size() || !equalsIgnoringCase(URL.substr(0, scheme.size()), scheme))
        return std::nullopt;
    std::string_view rest = URL.substr(scheme.size());
    if (rest.starts_with("//")) {
        rest.remove_prefix(2);
        const std::string_view host = rest.substr(0, rest.find('/'));
        if (!host.empty() && !equalsIgnoringCase(host, "localhost"))
            return std::nullopt;
        rest.remove_prefix(host.size());
    }
    rest = rest.substr(0, rest.find_first_of("?#"));
    if (!rest.starts_with('/'))
        return std::nullopt;
    return percentDecoded(rest);
}

} // namespace tarn
