#include "ipc/ConnectionSocket.h"

#include <sys/socket.h>

#include <utility>

namespace tarn {

namespace {

/// A burst that has gathered this much does not wait for its end.
constexpr std::size_t enoughForOneWrite = 65'536;

} // namespace

ConnectionSocket::ConnectionSocket(FileDescriptor socket, SocketPoller& poller, std::uint64_t key,
                                   Sum unfinished)
    : socket_(std::move(socket)), unfinishedOfAll_(std::move(unfinished)), poller_(poller), key_(key) {}

void ConnectionSocket::send(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body) {
    {
        std::lock_guard lock(mutex_);
        if (!socket_ || overflowed_)
            return;
        waiting_.append(kind, callId, body);
        if (waiting_.size() > enoughForOneWrite)
            flushLocked();
        if (socketIsFull_ || waiting_.size() == 0)
            return;
    }
    Burst::defer(shared_from_this());
}

void ConnectionSocket::finishBurst() noexcept {
    std::lock_guard lock(mutex_);
    flushLocked();
}

void ConnectionSocket::flush() {
    std::lock_guard lock(mutex_);
    socketIsFull_ = false;
    flushLocked();
    showInterest();
}

void ConnectionSocket::flushLocked() {
    if (!socket_ || overflowed_)
        return;
    auto result = SendBuffer::Result::socketIsFull;
    if (!socketIsFull_)
        result = waiting_.flush(socket_.get());
    overflowed_ = result == SendBuffer::Result::socketIsFull && waiting_.size() > mostQueuedBytes;
    if (overflowed_ || result == SendBuffer::Result::peerIsGone) {
        waiting_.clear();
        ::shutdown(socket_.get(), SHUT_RDWR);
    } else if (result == SendBuffer::Result::socketIsFull && !socketIsFull_) {
        socketIsFull_ = true;
        showInterest();
    }
}

void ConnectionSocket::beginCall(std::size_t bytes) {
    ++unfinishedCalls_;
    unfinishedBytes_ += bytes;
    *unfinishedOfAll_ += bytes;
}

void ConnectionSocket::finishCall(std::size_t bytes) {
    unfinishedBytes_ -= bytes;
    *unfinishedOfAll_ -= bytes;
    --unfinishedCalls_;
    if (!paused_ || isOverLimit(2))
        return;
    std::lock_guard lock(mutex_);
    if (paused_.exchange(false))
        showInterest();
}

void ConnectionSocket::limitReading() {
    if (!isOverLimit(1))
        return;
    std::lock_guard lock(mutex_);
    // Whoever finishes a call from here on sees the pause; who finished one before is seen here.
    paused_ = true;
    if (!isOverLimit(2))
        paused_ = false;
    showInterest();
}

// Calls of this connection are what it waits for, also when the others have more: without any it is not over
// a limit.
bool ConnectionSocket::isOverLimit(std::uint32_t divisor) const {
    const std::size_t most = mostUnfinishedBytes / divisor;
    return unfinishedCalls_ >= mostUnfinishedCalls / divisor || unfinishedBytes_ >= most ||
           (*unfinishedOfAll_ >= most && unfinishedBytes_ >= shareOfUnfinishedBytes / divisor);
}

bool ConnectionSocket::watch() { return poller_.add(socket_.get(), key_, EPOLLRDHUP); }

void ConnectionSocket::startReading() {
    std::lock_guard lock(mutex_);
    reading_ = true;
    showInterest();
}

bool ConnectionSocket::beginArrival(int files) {
    std::lock_guard lock(mutex_);
    filesArrive_ = poller_.add(files, key_ | arrivalKey, EPOLLIN);
    if (filesArrive_)
        poller_.remove(socket_.get());
    return filesArrive_;
}

void ConnectionSocket::endArrival(int files) {
    std::lock_guard lock(mutex_);
    if (!std::exchange(filesArrive_, false))
        return;
    poller_.remove(files);
    if (!poller_.add(socket_.get(), key_, EPOLLRDHUP)) // the system has no more: as if the peer were gone
        ::shutdown(socket_.get(), SHUT_RDWR);
    showInterest();
}

void ConnectionSocket::showInterest() {
    if (!socket_ || filesArrive_)
        return;
    std::uint32_t events = EPOLLRDHUP;
    if (reading_ && !paused_)
        events |= EPOLLIN;
    if (socketIsFull_)
        events |= EPOLLOUT;
    poller_.change(socket_.get(), key_, events);
}

std::string_view ConnectionSocket::failure() const {
    std::lock_guard lock(mutex_);
    return overflowed_ ? "the client does not read what it is sent" : std::string_view();
}

void ConnectionSocket::close() {
    std::lock_guard lock(mutex_);
    if (!socket_)
        return;
    poller_.remove(socket_.get());
    socket_.reset();
    waiting_.clear();
}

} // namespace tarn
