#include "ipc/SendBuffer.h"

#include <sys/socket.h>

#include <cerrno>

namespace tarn {

namespace {

/// A buffer that grew beyond this for a slow reader is given back.
constexpr std::size_t keptBufferCapacity = 16'384;

} // namespace

void SendBuffer::append(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body) {
    // What was sent is dropped only when it is the greater part, so that a byte moves at most once.
    if (sent_ > bytes_.size() / 2) {
        bytes_.erase(bytes_.begin(), bytes_.begin() + static_cast<std::ptrdiff_t>(sent_));
        sent_ = 0;
    }
    appendFrame(bytes_, kind, callId, body);
}

SendBuffer::Result SendBuffer::flush(int socket) {
    while (size() > 0) {
        const auto count = ::send(socket, bytes_.data() + sent_, size(), MSG_DONTWAIT | MSG_NOSIGNAL);
        if (count >= 0)
            sent_ += static_cast<std::size_t>(count);
        else if (errno == EAGAIN || errno == ENOBUFS || errno == ENOMEM)
            return Result::socketIsFull;
        else if (errno != EINTR)
            return Result::peerIsGone;
    }
    clear();
    return Result::empty;
}

void SendBuffer::clear() {
    bytes_.clear();
    sent_ = 0;
    if (bytes_.capacity() > keptBufferCapacity)
        bytes_ = {};
}

} // namespace tarn
