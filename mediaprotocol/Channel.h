#pragma once

#include <array>
#include <chrono>
#include <cstddef>
#include <cstring>
#include <optional>
#include <span>
#include <type_traits>
#include <utility>

#include "mediaprotocol/Messages.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// One message as it came, of whatever kind.
class ReceivedMessage {
public:
    static constexpr std::size_t longest = 8192;
    static constexpr std::size_t mostFiles = 2;

    /// The message, when it is of this kind and length; none otherwise.
    template <class Message>
    std::optional<Message> as() const {
        Message message;
        const MessageKind expected = message.kind;
        if (size_ != sizeof message)
            return std::nullopt;
        std::memcpy(&message, bytes_.data(), sizeof message);
        return message.kind == expected ? std::optional(message) : std::nullopt;
    }

    /// The descriptor in this place; none when so many did not come.
    FileDescriptor takeFile(std::size_t index = 0) { return std::move(files_[index]); }

private:
    friend class Channel;

    alignas(8) std::array<std::byte, longest> bytes_{};
    std::size_t size_ = 0;
    std::array<FileDescriptor, mostFiles> files_;
};

/// One end of a socket between the service and a process that handles media. A message is sent and received
/// whole or not at all. Any thread may send; one at a time receives.
class Channel {
public:
    using Deadline = std::chrono::steady_clock::time_point;
    enum class Result {
        done,
        notNow, ///< there is no message, or no room for one
        gone,   ///< the other end is closed
        broken, ///< what came breaks the rules: too long, or with more descriptors than it may have
    };

    Channel() = default;
    explicit Channel(FileDescriptor socket) : socket_(std::move(socket)) {}

    /// Two ends that are joined; none when the system has no more.
    static std::optional<std::pair<Channel, Channel>> makePair();

    int socket() const { return socket_.get(); }

    /// The socket itself; the channel is of no use then.
    FileDescriptor takeSocket() { return std::move(socket_); }

    explicit operator bool() const { return static_cast<bool>(socket_); }

    /// Never waits. `files` stay the caller's.
    template <class Message>
    [[nodiscard]] Result send(const Message& message, std::span<const int> files = {}) const {
        static_assert(std::has_unique_object_representations_v<Message> &&
                      sizeof(Message) <= ReceivedMessage::longest);
        return sendBytes({reinterpret_cast<const std::byte*>(&message), sizeof message}, files);
    }

    /// Takes a message that is there. Descriptors beyond `mostFiles` are never opened here.
    Result receiveNow(ReceivedMessage& message, std::size_t mostFiles = 0) const;

    /// Waits for a message until the deadline.
    Result receiveUntil(Deadline deadline, ReceivedMessage& message, std::size_t mostFiles = 0) const;

    /// Waits for a message, with no system call but recvmsg(2); `notNow` when limitWaits() cut it short.
    Result receive(ReceivedMessage& message, std::size_t mostFiles = 0) const;

    /// From now on receive() waits no longer than this.
    void limitWaits(std::chrono::seconds limit) const;

private:
    Result sendBytes(std::span<const std::byte> bytes, std::span<const int> files) const;
    Result receiveBytes(ReceivedMessage& message, std::size_t mostFiles, int flags) const;

    FileDescriptor socket_;
};

} // namespace tarn
