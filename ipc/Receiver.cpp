#include "ipc/Receiver.h"

#include <sys/socket.h>

#include <cerrno>

namespace tarn {

Received Receiver::read(int socket, int flags) {
    iovec part{buffer_.get(), size};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    ssize_t count = 0;
    do
        count = ::recvmsg(socket, &message, flags | MSG_DONTWAIT);
    while (count < 0 && errno == EINTR);
    if (count < 0)
        return {errno == EAGAIN ? Received::State::nothingNow : Received::State::ended, {}};
    const std::span<const std::uint8_t> bytes(buffer_.get(), static_cast<std::size_t>(count));
    if ((message.msg_flags & MSG_CTRUNC) != 0) // there was no room for them
        return {Received::State::withFiles, bytes};
    return {count == 0 ? Received::State::ended : Received::State::open, bytes};
}

Received Receiver::receive(int socket) {
    const Received received = read(socket, 0);
    return received.state == Received::State::withFiles ? Received{Received::State::ended, {}} : received;
}

Received Receiver::receiveUpToFiles(int socket) {
    const Received seen = read(socket, MSG_PEEK);
    if (seen.state == Received::State::open)
        ::recv(socket, buffer_.get(), seen.bytes.size(), MSG_DONTWAIT); // the same bytes
    return seen;
}

bool Receiver::drain(int socket) {
    ::shutdown(socket, SHUT_RD);
    for (;;) {
        const Received::State state = receiveUpToFiles(socket).state;
        if (state != Received::State::open)
            return state == Received::State::withFiles;
    }
}

} // namespace tarn
