#include "platform/linux/ipc/Receiver.h"

#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace tarn {

namespace {

/// More than any rightful read brings: one file belongs to one frame, and the system ends a read behind it.
constexpr std::size_t mostFiles = 8;

std::vector<FileDescriptor> filesOf(msghdr& message) {
    std::vector<FileDescriptor> files;
    for (cmsghdr* control = CMSG_FIRSTHDR(&message); control != nullptr;
         control = CMSG_NXTHDR(&message, control)) {
        if (control->cmsg_level != SOL_SOCKET || control->cmsg_type != SCM_RIGHTS)
            continue;
        const std::size_t count = (control->cmsg_len - CMSG_LEN(0)) / sizeof(int);
        std::array<int, mostFiles> numbers{};
        std::memcpy(numbers.data(), CMSG_DATA(control), count * sizeof(int));
        for (std::size_t i = 0; i < count; ++i)
            files.emplace_back(numbers[i]);
    }
    return files;
}

} // namespace

Received Receiver::receive(int socket, Wait wait) {
    iovec part{buffer_.get(), size};
    alignas(cmsghdr) std::array<std::byte, CMSG_SPACE(mostFiles * sizeof(int))> control{};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control.data();
    message.msg_controllen = control.size();

    const int flags = MSG_CMSG_CLOEXEC | (wait == Wait::never ? MSG_DONTWAIT : 0);
    ssize_t count = 0;
    do
        count = ::recvmsg(socket, &message, flags);
    while (count < 0 && errno == EINTR);

    if (count < 0)
        return {errno == EAGAIN ? Received::State::nothingNow : Received::State::ended, {}, {}};
    Received received;
    received.files = filesOf(message);
    received.bytes = {buffer_.get(), static_cast<std::size_t>(count)};
    if ((message.msg_flags & MSG_CTRUNC) != 0)
        received.state = Received::State::truncatedFiles;
    else if (count == 0)
        received.state = Received::State::ended;
    return received;
}

} // namespace tarn
