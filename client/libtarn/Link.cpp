#include "client/libtarn/Link.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>
#include <system_error>
#include <utility>
#include <vector>

#include "client/libtarn/Shielded.h"
#include "ipc/TransportMessages.h"

namespace tarn {

namespace {

using client::Answer;
using client::Outcome;
using Displacement = client::Connection::Displacement;

constexpr std::size_t mostSentAhead = 1'048'576;
constexpr int millisecondsForTheServiceToSee = 1'000;

Answer answerOf(const Frame& frame) {
    if (frame.kind == FrameKind::released)
        return {Outcome::released, {}, {}};
    auto reply = decodeReply(frame.body);
    if (!reply)
        return {Outcome::released, {}, {}};
    if (reply->error)
        return {Outcome::failed, {}, {reply->error->domain, reply->error->code, reply->error->userInfo}};
    return {Outcome::answered, std::move(reply->data), {}};
}

/// 0, or the reason of the errors of system calls. A stranger who listens would be sent files.
int refusalOf(int socket) {
    ucred peer{};
    socklen_t size = sizeof(peer);
    if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0)
        return errno;
    return peer.uid == ::geteuid() || peer.uid == 0 ? 0 : EPERM;
}

UnsharedDescriptor connected(const SocketAddress& address, const std::string& path, Link::Patience patience) {
    const int flags = patience == Link::Patience::givesUp ? SOCK_NONBLOCK : 0;
    UnsharedDescriptor socket([&] { return ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | flags, 0); });
    int problem = 0;
    if (!socket || !address.connect(socket.get()))
        problem = errno;
    else
        problem = refusalOf(socket.get());
    if (problem != 0)
        throw std::system_error(problem, std::generic_category(), path);
    return socket;
}

} // namespace

Link::Link(Handlers handlers, std::string path, client::Driver driver)
    : handlers_(std::move(handlers.connection)),
      address_(path),
      path_(std::move(path)),
      driver_(driver),
      loop_({.onSocket = [this](std::uint32_t events) { handleSocket(events); },
             .onTime = [onTime = std::move(handlers.onTime)] { shielded(onTime); }}) {}

void Link::start() {
    if (driver_ == client::Driver::ownThread)
        loop_.startThread();
}

void Link::stop() {
    loop_.stop();
    disconnect();
}

void Link::connect(Patience patience) {
    const auto held = loop_.hold();
    if (std::exchange(wasTakenOver_, false) && isConnected())
        takeOver(patience);
    end(false);
    auto socket = connected(address_, path_, patience);
    loop_.watch(socket.get());
    reader_.emplace(FrameReader::Sender::service);
    ++connectionCount_;
    tellsNews_ = false;
    {
        const std::lock_guard lock(mutex_);
        socket_ = std::move(socket);
        connected_ = true;
        socketIsFull_ = false;
    }
    if (handlers_.onDisplaced)
        call(Data(askForNews.begin(), askForNews.end()),
             [this](const Answer& answer) { tellsNews_ = answer.outcome == Outcome::answered; });
}

/// A connection that lasts until the service has seen it.
void Link::takeOver(Patience patience) {
    const auto socket = connected(address_, path_, patience);
    Outgoing question;
    question.append(FrameKind::call, 1, askForNews);
    question.flush(socket.get());
    pollfd answer{socket.get(), POLLIN, 0};
    ::poll(&answer, 1, millisecondsForTheServiceToSee);
}

void Link::disconnect() {
    const auto held = loop_.hold();
    end(false);
}

void Link::requireThatItFits(const Data& body) {
    if (body.size() > FrameHeader::largestBody)
        throw std::length_error("an envelope has at most 1 MiB");
}

bool Link::call(const Data& body, AnswerHandler&& handler) {
    const std::lock_guard lock(mutex_);
    if (!connected_)
        return false;
    const auto id = nextCallId_++;
    outgoing_.append(FrameKind::call, id, body);
    pending_.emplace_hint(pending_.end(), id, std::move(handler));
    flush();
    return true;
}

bool Link::send(FrameKind kind, const Data& body, FileDescriptor file) {
    const std::lock_guard lock(mutex_);
    if (!connected_)
        return false;
    outgoing_.append(kind, 0, body, std::move(file));
    flush();
    return true;
}

bool Link::isConnected() const {
    const std::lock_guard lock(mutex_);
    return connected_;
}

/// With the mutex. That the peer is gone is seen by the loop, after all that it still had to say.
void Link::flush() {
    if (outgoing_.flush(socket_.get()) == Outgoing::Result::peerIsGone)
        outgoing_.clear();
    const bool isFull = outgoing_.size() > 0;
    if (isFull != socketIsFull_)
        loop_.watchForRoom(socket_.get(), isFull);
    socketIsFull_ = isFull;
}

/// A program with its own loop would wait for itself, and so would a handler.
void Link::waitForRoom() {
    if (driver_ == client::Driver::program || loop_.isCurrent())
        return;
    std::unique_lock lock(mutex_);
    roomMade_.wait(lock, [this] { return outgoing_.size() <= mostSentAhead; });
}

void Link::handleSocket(std::uint32_t events) {
    try {
        serveSocket(events);
    } catch (...) { // no memory is left for what came, and nothing behind it can be understood
        end(true);
    }
}

void Link::serveSocket(std::uint32_t events) {
    if ((events & EPOLLOUT) != 0) {
        const std::lock_guard lock(mutex_);
        flush();
        if (outgoing_.size() <= mostSentAhead)
            roomMade_.notify_all();
    }
    if ((events & ~std::uint32_t{EPOLLOUT}) != 0)
        read();
}

void Link::read() {
    const auto connection = connectionCount_;
    const Received received = receiver_.receive(socket_.get());
    std::vector<Frame> frames;
    const auto broken = reader_->take(received.bytes, {}, frames);
    for (const auto& frame : frames) {
        if (connection != connectionCount_ || !isConnected())
            return; // a handler has seen to that
        deliver(frame);
    }
    const bool ended = received.state == Received::State::ended;
    if (connection == connectionCount_ && (broken || ended))
        end(true);
}

void Link::deliver(const Frame& frame) {
    switch (frame.kind) {
    case FrameKind::event:
        if (handlers_.onEvent)
            shielded([&] { handlers_.onEvent(frame.body); });
        return;
    case FrameKind::takenOver:
        return tellDisplaced(Displacement::takenOver);
    case FrameKind::forgotten:
        return tellDisplaced(Displacement::forgotten);
    default:
        break;
    }
    AnswerHandler handler;
    {
        const std::lock_guard lock(mutex_);
        if (auto found = pending_.extract(frame.callId))
            handler = std::move(found.mapped());
    }
    if (handler)
        shielded([&] { handler(answerOf(frame)); });
}

void Link::tellDisplaced(Displacement reason) {
    wasTakenOver_ = reason == Displacement::takenOver;
    if (handlers_.onDisplaced)
        shielded([&] { handlers_.onDisplaced(reason); });
}

/// With the loop held.
void Link::end(bool tell) {
    std::map<std::uint64_t, AnswerHandler> ended;
    {
        const std::lock_guard lock(mutex_);
        if (!connected_)
            return;
        connected_ = false;
        loop_.unwatch(socket_.get());
        ::shutdown(socket_.get(), SHUT_RDWR);
        socket_.reset();
        outgoing_.clear();
        ended.swap(pending_);
        roomMade_.notify_all();
    }
    for (const auto& [id, handler] : ended)
        shielded([&, &end = handler] { end(Answer{}); });
    if (tell && handlers_.onLost)
        shielded(handlers_.onLost);
}

} // namespace tarn
