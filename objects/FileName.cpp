#include "objects/FileName.h"

#include <algorithm>
#include <optional>
#include <string_view>

#include "wire/Utf8.h"

namespace tarn {

namespace {

/// What lies behind scheme and host and before query and fragment, without slashes at its end.
std::string_view pathOfURL(std::string_view URL) {
    URL = URL.substr(0, URL.find_first_of("?#"));
    if (auto scheme = URL.find(':'); scheme < URL.find('/'))
        URL.remove_prefix(scheme + 1);
    if (URL.starts_with("//"))
        URL.remove_prefix(std::min(URL.find('/', 2), URL.size()));
    while (URL.ends_with('/'))
        URL.remove_suffix(1);
    return URL;
}

std::optional<char> hexadecimalByte(std::string_view digits) {
    std::size_t value = 0;
    for (char digit : digits) {
        std::size_t place = std::string_view("0123456789abcdef0123456789ABCDEF").find(digit);
        if (place == std::string_view::npos)
            return std::nullopt;
        value = value * 16 + place % 16;
    }
    return static_cast<char>(value);
}

/// None when a percent sign does not begin a byte, and when the bytes are not text.
std::optional<std::string> withoutPercentEncoding(std::string_view encoded) {
    std::string decoded;
    while (!encoded.empty()) {
        std::size_t length = encoded.front() == '%' ? 3 : 1;
        if (encoded.size() < length)
            return std::nullopt;
        std::optional<char> byte = length == 3 ? hexadecimalByte(encoded.substr(1, 2)) : encoded.front();
        if (!byte || *byte == '\0')
            return std::nullopt;
        decoded += *byte;
        encoded.remove_prefix(length);
    }
    return isValidUtf8(decoded) ? std::optional(decoded) : std::nullopt;
}

} // namespace

std::string fileNameOfURL(const std::string& URL) {
    std::string_view path = pathOfURL(URL);
    std::string_view name = path.substr(path.rfind('/') + 1); // npos + 1 is 0: all of it
    return withoutPercentEncoding(name).value_or(std::string(name));
}

} // namespace tarn
