#include "mediaprotocol/Parking.h"

#include <sys/socket.h>

#include <cerrno>
#include <cstddef>
#include <cstring>

namespace tarn {

bool sendParked(int socket, int file, int error) {
    iovec part{&error, sizeof error};
    alignas(cmsghdr) std::byte control[CMSG_SPACE(sizeof file)]{};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    if (file >= 0) {
        message.msg_control = control;
        message.msg_controllen = sizeof control;
        cmsghdr* header = CMSG_FIRSTHDR(&message);
        header->cmsg_level = SOL_SOCKET;
        header->cmsg_type = SCM_RIGHTS;
        header->cmsg_len = CMSG_LEN(sizeof file);
        std::memcpy(CMSG_DATA(header), &file, sizeof file);
    }
    return ::sendmsg(socket, &message, MSG_NOSIGNAL | MSG_DONTWAIT) == sizeof error;
}

ParkedFile takeParked(int socket) {
    ParkedFile parked;
    iovec part{&parked.error, sizeof parked.error};
    alignas(cmsghdr) std::byte control[CMSG_SPACE(sizeof(int))]{};
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = CMSG_LEN(sizeof(int));
    ssize_t count = 0;
    do
        count = ::recvmsg(socket, &message, MSG_PEEK | MSG_CMSG_CLOEXEC);
    while (count < 0 && errno == EINTR);
    const cmsghdr* header = count == sizeof parked.error ? CMSG_FIRSTHDR(&message) : nullptr;
    if (header != nullptr && header->cmsg_level == SOL_SOCKET && header->cmsg_type == SCM_RIGHTS) {
        int file = -1;
        std::memcpy(&file, CMSG_DATA(header), sizeof file);
        parked.file.reset(file);
    } else if (parked.error == 0) {
        parked.error = EIO; // whoever was to open it is gone
    }
    return parked;
}

} // namespace tarn
