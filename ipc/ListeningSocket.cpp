#include "ipc/ListeningSocket.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <systemd/sd-daemon.h>

#include <cerrno>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <system_error>

#include "ipc/SocketAddress.h"

namespace tarn {

namespace {

constexpr int backlog = 64;

[[noreturn]] void fail(const std::string& what) {
    throw std::system_error(errno, std::generic_category(), what);
}

/// The socket that systemd holds for the service; none when it was started by hand.
FileDescriptor handedOver(const std::string& name) {
    char** names = nullptr;
    const int count = sd_listen_fds_with_names(1, &names);
    FileDescriptor found;
    for (int i = 0; i < count; ++i) {
        FileDescriptor socket(SD_LISTEN_FDS_START + i);
        const std::unique_ptr<char, decltype(&std::free)> itsName(names[i], &std::free);
        if (!found && name == itsName.get() &&
            sd_is_socket_unix(socket.get(), SOCK_STREAM, 1, nullptr, 0) > 0)
            found = std::move(socket);
    }
    std::free(names); // NOLINT(bugprone-multi-level-implicit-pointer-conversion)
    return found;
}

bool somebodyListens(const SocketAddress& address) {
    const FileDescriptor probe(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    // A full backlog answers EAGAIN: somebody is there, too busy to accept.
    return address.connect(probe.get()) || errno == EAGAIN;
}

} // namespace

ListeningSocket::ListeningSocket(const std::string& name) : socket_(handedOver(name)) {
    if (!socket_)
        makeFile(serviceSocketPath(name));
    ::fcntl(socket_.get(), F_SETFL, ::fcntl(socket_.get(), F_GETFL) | O_NONBLOCK);
}

ListeningSocket::~ListeningSocket() { removeFile(); }

void ListeningSocket::removeFile() const {
    if (!path_.empty())
        ::unlink(path_.c_str());
}

void ListeningSocket::makeFile(const std::string& path) {
    const SocketAddress address(path);
    const std::string lockPath = path + ".lock";
    lock_.reset(::open(lockPath.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, S_IRUSR | S_IWUSR));
    if (!lock_)
        fail(lockPath);
    // Two that start at once must not both find the same stale file and replace each other's.
    if (::flock(lock_.get(), LOCK_EX | LOCK_NB) != 0 || somebodyListens(address))
        throw std::runtime_error(path + " is served by another process");
    if (::unlink(path.c_str()) != 0 && errno != ENOENT)
        fail(path);

    socket_.reset(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    // The mode of an unbound socket becomes that of its file, so that nobody else ever has access.
    if (!socket_ || ::fchmod(socket_.get(), S_IRUSR | S_IWUSR) != 0 || !address.bind(socket_.get()))
        fail(path);
    path_ = path;
    if (::listen(socket_.get(), backlog) != 0)
        fail(path);
}

} // namespace tarn
