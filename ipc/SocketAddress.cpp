#include "ipc/SocketAddress.h"

#include <sys/socket.h>

#include <cerrno>
#include <cstdlib>
#include <system_error>

namespace tarn {

namespace {

const sockaddr* generic(const sockaddr_un& address) { return reinterpret_cast<const sockaddr*>(&address); }

} // namespace

SocketAddress::SocketAddress(const std::string& path) {
    address_.sun_family = AF_UNIX;
    if (path.size() >= sizeof(address_.sun_path))
        throw std::system_error(ENAMETOOLONG, std::generic_category(), path);
    path.copy(address_.sun_path, path.size());
}

bool SocketAddress::bind(int socket) const {
    return ::bind(socket, generic(address_), sizeof(address_)) == 0;
}

bool SocketAddress::connect(int socket) const {
    return ::connect(socket, generic(address_), sizeof(address_)) == 0;
}

std::string serviceSocketPath(const std::string& name) {
    const char* folder = std::getenv("XDG_RUNTIME_DIR"); // NOLINT(concurrency-mt-unsafe): nobody sets it
    return std::string(folder != nullptr && *folder != '\0' ? folder : "/run") + "/" + name;
}

} // namespace tarn
