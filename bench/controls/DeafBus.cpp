#include "bench/controls/DeafBus.h"

#include <cerrno>
#include <system_error>

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace tarn {

DeafBus::DeafBus(const std::string& path) : socket_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(std::begin(address.sun_path), sizeof address.sun_path - 1);
    unlink(path.c_str());
    if (bind(socket_.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
        listen(socket_.get(), 4) != 0)
        throw std::system_error(errno, std::generic_category(), path);
}

bool DeafBus::refuseOne() {
    pollfd caller{.fd = socket_.get(), .events = POLLIN, .revents = 0};
    if (poll(&caller, 1, 10'000) != 1)
        return false;
    return static_cast<bool>(FileDescriptor(accept4(socket_.get(), nullptr, nullptr, SOCK_CLOEXEC)));
}

} // namespace tarn
