#include "ipc/Receiver.h"

#include <sys/socket.h>

#include <cerrno>
#include <cstring>

namespace tarn {

namespace {

/// What the system lets through at once (SCM_MAX_FD), though a rightful read brings one: what there is no
/// room for is closed by the system, and that may take for ever.
constexpr std::size_t mostFiles = 253;

std::vector<ReceivedFile> filesOf(msghdr& message) {
    std::vector<ReceivedFile> files;
    for (cmsghdr* control = CMSG_FIRSTHDR(&message); control != nullptr;
         control = CMSG_NXTHDR(&message, control)) {
        if (control->cmsg_level != SOL_SOCKET || control->cmsg_type != SCM_RIGHTS)
            continue;
        const std::size_t count = (control->cmsg_len - CMSG_LEN(0)) / sizeof(int);
        for (std::size_t i = 0; i < count; ++i) {
            int number = -1;
            std::memcpy(&number, CMSG_DATA(control) + i * sizeof(int), sizeof(int));
            files.emplace_back(FileDescriptor(number));
        }
    }
    return files;
}

} // namespace

Received Receiver::receive(int socket, Wait wait) {
    iovec part{buffer_.get(), size};
    alignas(cmsghdr) std::byte control[CMSG_SPACE(mostFiles * sizeof(int))]; // filled by the system
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof(control);

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

void Receiver::drain(int socket) {
    ::shutdown(socket, SHUT_RD);
    Received::State state = Received::State::open;
    while (state == Received::State::open || state == Received::State::truncatedFiles)
        state = receive(socket).state;
}

} // namespace tarn
