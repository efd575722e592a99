#include "ipc/SocketListener.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <systemd/sd-daemon.h>

#include <cassert>
#include <cerrno>
#include <system_error>
#include <utility>
#include <vector>

#include "log/SystemLog.h"

namespace tarn {

namespace {

FileDescriptor openSpare() { return FileDescriptor(::open("/dev/null", O_RDONLY | O_CLOEXEC)); }

} // namespace

SocketListener::SocketListener(FileDescriptor listeningSocket, TokenTable& tokens, FileReceiver& files)
    : listeningSocket_(std::move(listeningSocket)), spare_(openSpare()), tokens_(tokens), files_(files) {}

SocketListener::~SocketListener() {
    thread_.request_stop();
    poller_.wake();
    if (thread_.joinable())
        thread_.join();
    for (const auto& [key, connection] : connections_)
        connection->close(receiver_);
}

void SocketListener::resume() {
    assert(delegate_ != nullptr);
    if (!poller_.add(listeningSocket_.get(), listenerKey, EPOLLIN))
        throw std::system_error(errno, std::generic_category(), "epoll_ctl");
    thread_ = std::jthread([this](const std::stop_token& stop) { run(stop); });
    sd_notify(0, "READY=1");
}

void SocketListener::run(const std::stop_token& stop) {
    while (true) {
        bool clientWaits = false;
        for (const auto& event : poller_.wait()) {
            if (stop.stop_requested())
                return;
            if (event.data.u64 == listenerKey)
                clientWaits = true;
            else
                serve(event.data.u64, event.events);
        }
        if (clientWaits)
            accept();
    }
}

void SocketListener::serve(std::uint64_t key, std::uint32_t events) {
    const auto found = connections_.find(key & ~ConnectionSocket::arrivalKey);
    if (found == connections_.end())
        return;
    const auto connection = found->second;
    const bool isArrival = (key & ConnectionSocket::arrivalKey) != 0;
    bool lives = isArrival ? connection->finishArrival() : connection->handle(events, receiver_);
    if (lives)
        lives = !isOverLimit(*connection);
    if (lives)
        return;
    connections_.erase(found);
    connection->reportLoss(receiver_);
    displaceOthers(nullptr, FrameKind::forgotten);
}

/// The service serves the connection that it accepted last, and none once any connection was lost.
void SocketListener::displaceOthers(const SocketConnection* current, FrameKind news) {
    for (const auto& [key, connection] : connections_)
        if (connection.get() != current)
            connection->displace(news);
}

void SocketListener::accept() {
    auto socket = takeFromBacklog();
    // A client that died and came straight back has hung up before it connected again. Its old connection
    // must be gone before the new one is offered, or its loss would take the new one down.
    serveHangUps();
    if (!socket)
        return;
    if (!mayBeOffered(socket.get()))
        return letGo(socket.get());
    toldOfRefusal_ = false;
    offer(std::move(socket));
}

FileDescriptor SocketListener::takeFromBacklog() {
    FileDescriptor socket(::accept4(listeningSocket_.get(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK));
    if (!socket && (errno == EMFILE || errno == ENFILE)) {
        refuse("no file descriptors are left");
        spare_.reset();
        FileDescriptor refused(::accept4(listeningSocket_.get(), nullptr, nullptr, SOCK_CLOEXEC));
        refused.reset();
        spare_ = openSpare();
    }
    return socket;
}

void SocketListener::serveHangUps() {
    std::vector<pollfd> sockets;
    std::vector<std::uint64_t> keys;
    for (const auto& [key, connection] : connections_) {
        sockets.push_back({connection->socket(), POLLRDHUP, 0});
        keys.push_back(key);
    }
    if (::poll(sockets.data(), sockets.size(), 0) <= 0)
        return;
    for (std::size_t i = 0; i < sockets.size(); ++i)
        if (sockets[i].revents != 0)
            serve(keys[i], EPOLLRDHUP);
}

bool SocketListener::mayBeOffered(int socket) {
    ucred peer{};
    socklen_t size = sizeof(peer);
    if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0)
        refuse("its user is not known");
    else if (peer.uid != ::geteuid() && peer.uid != 0)
        refuse("it belongs to another user");
    else if (connections_.size() >= mostConnections)
        refuse("there are too many");
    else
        return true;
    return false;
}

void SocketListener::refuse(std::string_view reason) {
    if (!std::exchange(toldOfRefusal_, true))
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: refused a client: %{public}s", reason);
}

/// For a socket that is about to be closed without having been served.
void SocketListener::letGo(int socket) {
    if (receiver_.drain(socket))
        files_.drop(socket);
}

void SocketListener::offer(FileDescriptor descriptor) {
    const auto key = nextKey_++;
    const auto socket =
        std::make_shared<ConnectionSocket>(std::move(descriptor), poller_, key, unfinishedBytes_);
    if (!socket->watch())
        return refuse("the system cannot watch it");
    const auto connection = std::make_shared<SocketConnection>(socket, key, tokens_, files_);
    connections_.emplace(key, connection);
    if (delegate_->listenerShouldAcceptNewConnection(*this, connection))
        return displaceOthers(connection.get(), FrameKind::takenOver);
    connections_.erase(key);
    connection->close(receiver_);
}

bool SocketListener::isOverLimit(SocketConnection& connection) {
    if (connection.unfinishedBytes() == 0)
        return false;
    std::size_t sum = 0;
    for (const auto& [key, other] : connections_)
        sum += other->unfinishedBytes();
    if (sum <= mostUnfinishedBytes)
        return false;
    connection.interrupt("all clients together left too much unfinished");
    return true;
}

} // namespace tarn
