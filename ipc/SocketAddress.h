#pragma once

#include <sys/un.h>

#include <string>

namespace tarn {

/// The address of a Unix socket that is known by a path.
class SocketAddress {
public:
    /// Throws std::system_error when the path is too long for one.
    explicit SocketAddress(const std::string& path);

    /// Both false with errno when it did not work.
    bool bind(int socket) const;
    bool connect(int socket) const;

private:
    sockaddr_un address_{};
};

/// Where the socket of a named service is: in XDG_RUNTIME_DIR, or in /run without it.
std::string serviceSocketPath(const std::string& name);

} // namespace tarn
