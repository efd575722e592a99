#include "mediaprotocol/Channel.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/time.h>

#include <algorithm>
#include <cassert>
#include <cerrno>

namespace tarn {

std::optional<std::pair<Channel, Channel>> Channel::makePair() {
    int ends[2];
    if (::socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
        return std::nullopt;
    return std::pair(Channel(FileDescriptor(ends[0])), Channel(FileDescriptor(ends[1])));
}

Channel::Result Channel::sendBytes(std::span<const std::byte> bytes, std::span<const int> files) const {
    assert(files.size() <= ReceivedMessage::mostFiles);
    iovec part{const_cast<std::byte*>(bytes.data()), bytes.size()}; // NOLINT: it is only read
    alignas(cmsghdr) std::byte control[CMSG_SPACE(ReceivedMessage::mostFiles * sizeof(int))]{};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    if (!files.empty()) {
        message.msg_control = control;
        message.msg_controllen = CMSG_SPACE(files.size_bytes());
        cmsghdr* header = CMSG_FIRSTHDR(&message);
        header->cmsg_level = SOL_SOCKET;
        header->cmsg_type = SCM_RIGHTS;
        header->cmsg_len = CMSG_LEN(files.size_bytes());
        std::memcpy(CMSG_DATA(header), files.data(), files.size_bytes());
    }
    ssize_t count = 0;
    do
        count = ::sendmsg(socket_.get(), &message, MSG_NOSIGNAL | MSG_DONTWAIT);
    while (count < 0 && errno == EINTR);
    if (count >= 0)
        return Result::done;
    return errno == EAGAIN || errno == ENOBUFS || errno == ETOOMANYREFS ? Result::notNow : Result::gone;
}

Channel::Result Channel::receiveBytes(ReceivedMessage& received, std::size_t mostFiles, int flags) const {
    assert(mostFiles <= ReceivedMessage::mostFiles);
    received.size_ = 0;
    received.files_ = {};
    iovec part{received.bytes_.data(), received.bytes_.size()};
    alignas(cmsghdr) std::byte control[CMSG_SPACE(ReceivedMessage::mostFiles * sizeof(int))]{};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = mostFiles > 0 ? control : nullptr;
    message.msg_controllen = mostFiles > 0 ? CMSG_LEN(mostFiles * sizeof(int)) : 0; // not the room for two
    ssize_t count = 0;
    do
        count = ::recvmsg(socket_.get(), &message, flags | MSG_CMSG_CLOEXEC);
    while (count < 0 && errno == EINTR);
    if (count < 0)
        return errno == EAGAIN ? Result::notNow : Result::gone;

    std::size_t index = 0;
    cmsghdr* header = mostFiles > 0 ? CMSG_FIRSTHDR(&message) : nullptr;
    if (header != nullptr && header->cmsg_level == SOL_SOCKET && header->cmsg_type == SCM_RIGHTS) {
        const std::size_t files = (header->cmsg_len - CMSG_LEN(0)) / sizeof(int);
        for (; index < std::min(files, received.files_.size()); ++index) {
            int number = -1;
            std::memcpy(&number, CMSG_DATA(header) + index * sizeof number, sizeof number);
            received.files_[index].reset(number);
        }
    }
    if ((message.msg_flags & (MSG_CTRUNC | MSG_TRUNC)) != 0)
        return Result::broken;
    if (count == 0)
        return Result::gone;
    received.size_ = static_cast<std::size_t>(count);
    return Result::done;
}

Channel::Result Channel::receiveNow(ReceivedMessage& message, std::size_t mostFiles) const {
    return receiveBytes(message, mostFiles, MSG_DONTWAIT);
}

Channel::Result Channel::receive(ReceivedMessage& message, std::size_t mostFiles) const {
    return receiveBytes(message, mostFiles, 0);
}

Channel::Result Channel::receiveUntil(Deadline deadline, ReceivedMessage& message,
                                      std::size_t mostFiles) const {
    for (;;) {
        const Result result = receiveNow(message, mostFiles);
        const auto left =
            std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
        if (result != Result::notNow || left.count() <= 0)
            return result;
        pollfd readable{.fd = socket_.get(), .events = POLLIN, .revents = 0};
        ::poll(&readable, 1, static_cast<int>(left.count()));
    }
}

void Channel::limitWaits(std::chrono::seconds limit) const {
    timeval time{};
    time.tv_sec = static_cast<decltype(time.tv_sec)>(limit.count());
    ::setsockopt(socket_.get(), SOL_SOCKET, SO_RCVTIMEO, &time, sizeof time);
}

} // namespace tarn
