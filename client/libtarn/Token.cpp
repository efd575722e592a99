#include "client/libtarn/Token.h"

#include <sys/random.h>

#include <array>
#include <cerrno>
#include <string_view>
#include <system_error>

namespace tarn {

std::string makeToken() {
    constexpr std::string_view digits = "0123456789ABCDEF";
    std::array<unsigned char, 16> random{};
    if (::getrandom(random.data(), random.size(), 0) != static_cast<ssize_t>(random.size()))
        throw std::system_error(errno, std::generic_category(), "getrandom");
    std::string token;
    for (const unsigned byte : random)
        token.append({digits[byte >> 4U], digits[byte & 0xFU]});
    return token;
}

} // namespace tarn
