#include "client/libtarn/Outgoing.h"

#include <sys/socket.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace tarn {

namespace {

/// What was sent of a part is kept until all of it is.
constexpr std::size_t enoughForOnePart = 65'536;

/// sendmsg(2) with a file beside the first byte unless it is -1.
ssize_t sendSome(int socket, std::span<const std::uint8_t> bytes, int file) {
    iovec part{const_cast<std::uint8_t*>(bytes.data()), bytes.size()};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    alignas(cmsghdr) std::byte control[CMSG_SPACE(sizeof(int))] = {};
    if (file >= 0) {
        message.msg_control = control;
        message.msg_controllen = sizeof(control);
        cmsghdr* header = CMSG_FIRSTHDR(&message);
        header->cmsg_level = SOL_SOCKET;
        header->cmsg_type = SCM_RIGHTS;
        header->cmsg_len = CMSG_LEN(sizeof(int));
        std::memcpy(CMSG_DATA(header), &file, sizeof(int));
    }
    ssize_t count = 0;
    do
        count = ::sendmsg(socket, &message, MSG_NOSIGNAL | MSG_DONTWAIT);
    while (count < 0 && errno == EINTR);
    return count;
}

} // namespace

void Outgoing::append(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body,
                      FileDescriptor file) {
    if (parts_.empty() || file || parts_.back().bytes.size() > enoughForOnePart)
        parts_.push_back({{}, std::move(file), 0});
    appendFrame(parts_.back().bytes, kind, callId, body);
    size_ += FrameHeader::size + body.size();
}

Outgoing::Result Outgoing::flush(int socket) {
    while (!parts_.empty()) {
        Part& part = parts_.front();
        const auto count = sendSome(socket, std::span(part.bytes).subspan(part.sent), part.file.get());
        if (count < 0)
            return errno == EAGAIN ? Result::socketIsFull : Result::peerIsGone;
        part.file.reset();
        part.sent += static_cast<std::size_t>(count);
        size_ -= static_cast<std::size_t>(count);
        if (part.sent == part.bytes.size())
            parts_.pop_front();
    }
    return Result::empty;
}

void Outgoing::clear() {
    parts_.clear();
    size_ = 0;
}

} // namespace tarn
