#include "tests/ipc/RawClient.h"

#include <poll.h>
#include <sys/socket.h>

#include <gtest/gtest.h>

#include <array>
#include <cstring>

#include "ipc/Receiver.h"
#include "ipc/SocketAddress.h"
#include "ipc/TransportMessages.h"

namespace tarn {

namespace {

constexpr int deadlineMilliseconds = 10'000;

} // namespace

RawClient::RawClient(const std::string& path) : socket_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    EXPECT_TRUE(SocketAddress(path).connect(socket_.get())) << path << ": " << std::strerror(errno);
}

bool RawClient::sendBytes(std::span<const std::uint8_t> bytes) const {
    while (!bytes.empty()) {
        const auto count = ::send(socket_.get(), bytes.data(), bytes.size(), MSG_NOSIGNAL);
        if (count < 0)
            return false;
        bytes = bytes.subspan(static_cast<std::size_t>(count));
    }
    return true;
}

bool RawClient::send(FrameKind kind, std::uint64_t callId, std::string_view body) const {
    Data bytes;
    appendFrame(bytes, kind, callId, {reinterpret_cast<const std::uint8_t*>(body.data()), body.size()});
    return sendBytes(bytes);
}

bool RawClient::sendWithFiles(std::span<const std::uint8_t> bytes, const std::vector<int>& files) const {
    Data content(bytes.begin(), bytes.end());
    iovec part{content.data(), content.size()};
    std::vector<std::byte> control(CMSG_SPACE(files.size() * sizeof(int)));
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control.data();
    message.msg_controllen = control.size();
    cmsghdr* header = CMSG_FIRSTHDR(&message);
    header->cmsg_level = SOL_SOCKET;
    header->cmsg_type = SCM_RIGHTS;
    header->cmsg_len = CMSG_LEN(files.size() * sizeof(int));
    std::memcpy(CMSG_DATA(header), files.data(), files.size() * sizeof(int));
    return ::sendmsg(socket_.get(), &message, MSG_NOSIGNAL) == static_cast<ssize_t>(content.size());
}

bool RawClient::grant(const std::string& token, const std::string& path, int file) const {
    Data bytes;
    appendFrame(bytes, FrameKind::extension, 0, encodeExtension({token, path}));
    return sendWithFiles(bytes, {file});
}

std::optional<Frame> RawClient::receive() {
    Receiver receiver;
    while (frames_.empty() && !ended_) {
        pollfd wait{socket_.get(), POLLIN, 0};
        if (::poll(&wait, 1, deadlineMilliseconds) != 1)
            return std::nullopt;
        auto received = receiver.receive(socket_.get());
        ended_ = received.state == Received::State::ended;
        EXPECT_FALSE(reader_.take(received.bytes, {}, frames_));
    }
    if (frames_.empty())
        return std::nullopt;
    Frame frame = std::move(frames_.front());
    frames_.erase(frames_.begin());
    return frame;
}

bool RawClient::isCutOff() {
    while (receive()) {
    }
    return ended_;
}

} // namespace tarn
