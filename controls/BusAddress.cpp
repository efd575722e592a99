#include "controls/BusAddress.h"

#include <cstdlib>
#include <string_view>

namespace tarn {

namespace {

/// An address escapes bytes as "%2f".
std::string unescaped(std::string_view text) {
    std::string result;
    for (std::size_t at = 0; at < text.size(); ++at) {
        if (text[at] != '%' || at + 2 >= text.size()) {
            result += text[at];
            continue;
        }
        const std::string digits(text.substr(at + 1, 2));
        result += static_cast<char>(std::strtol(digits.c_str(), nullptr, 16));
        at += 2;
    }
    return result;
}

std::string escaped(std::string_view path) {
    constexpr std::string_view plain = "-_/.\\*";
    constexpr char digits[] = "0123456789abcdef";
    std::string result;
    for (const char character : path) {
        const auto byte = static_cast<unsigned char>(character);
        const bool alphanumeric =
            (byte >= '0' && byte <= '9') || (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
        if (alphanumeric || plain.find(character) != std::string_view::npos)
            result += character;
        else
            result += {'%', digits[byte >> 4], digits[byte & 0xf]};
    }
    return result;
}

} // namespace

std::string sessionBusAddress() {
    if (const char* address = std::getenv("DBUS_SESSION_BUS_ADDRESS"); address && *address)
        return address;
    if (const char* folder = std::getenv("XDG_RUNTIME_DIR"); folder && *folder)
        return "unix:path=" + escaped(folder) + "/bus";
    return {};
}

std::string systemBusAddress() {
    if (const char* address = std::getenv("DBUS_SYSTEM_BUS_ADDRESS"); address && *address)
        return address;
    return "unix:path=/run/dbus/system_bus_socket";
}

std::optional<std::string> busSocketPath(const std::string& address) {
    constexpr std::string_view prefix = "unix:path=";
    const std::string_view first = std::string_view(address).substr(0, address.find(';'));
    if (!first.starts_with(prefix))
        return std::nullopt;
    const std::string_view value = first.substr(prefix.size());
    return unescaped(value.substr(0, value.find(',')));
}

} // namespace tarn
