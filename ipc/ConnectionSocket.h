#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <span>
#include <string_view>

#include "ipc/Frame.h"
#include "ipc/SendBuffer.h"
#include "ipc/SocketPoller.h"
#include "system/FileDescriptor.h"
#include "threads/Burst.h"

namespace tarn {

/// The socket of one connection as every thread may use it: frames go out in the order in which they were
/// given, and the calls that are not finished decide whether more is read.
///
/// Nothing here waits, calls out, or ends the connection: when the peer is gone or too slow, the socket is
/// shut down, which the I/O thread sees as a hang-up. Shared by the connection and its callbacks.
class ConnectionSocket final : public Burst::Deferred, public std::enable_shared_from_this<ConnectionSocket> {
public:
    static constexpr std::size_t mostQueuedBytes = 1'048'576;
    static constexpr std::uint32_t mostUnfinishedCalls = 1'024;
    static constexpr std::size_t mostUnfinishedBytes = std::size_t{4} * 1'048'576;
    /// While the calls of all connections together take mostUnfinishedBytes, each may have this much.
    static constexpr std::size_t shareOfUnfinishedBytes = 65'536;
    using Sum = std::shared_ptr<std::atomic<std::size_t>>;

    /// Beside a connection's own key: word of its files. No connection has a key with this bit.
    static constexpr std::uint64_t arrivalKey = std::uint64_t{1} << 63;

    /// The poller outlives close(). `unfinished` counts the bytes of the calls of all connections.
    ConnectionSocket(FileDescriptor socket, SocketPoller& poller, std::uint64_t key, Sum unfinished);

    /// Any thread. What is sent inside a burst leaves at its end. Dropped once it is closed.
    void send(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body);

    /// Any thread: a call that beginCall() announced is done with.
    void finishCall(std::size_t bytes);

    void finishBurst() noexcept override;

    // The rest is for the I/O thread.

    /// Good until close(), for reading.
    int socket() const { return socket_.get(); }

    /// Starts to watch for a hang-up. False when the system cannot.
    [[nodiscard]] bool watch();
    void startReading();
    void beginCall(std::size_t bytes);

    /// Watches `files` in place of the socket, under the key with arrivalKey: nothing is read meanwhile, and
    /// a hang-up is seen later. False when the system cannot.
    [[nodiscard]] bool beginArrival(int files);
    void endArrival(int files);

    /// Stops reading when too many calls are unfinished, until enough of them are finished.
    void limitReading();

    /// The socket takes more.
    void flush();

    /// Why the connection must end although the peer is there: none, or the text for the log.
    std::string_view failure() const;

    /// Closes the socket; frames that wait are dropped.
    void close();

private:
    bool isOverLimit(std::uint32_t divisor) const;
    void flushLocked();
    void showInterest();

    mutable std::mutex mutex_; // guards what follows up to the next blank line
    FileDescriptor socket_;
    SendBuffer waiting_;
    bool reading_ = false;
    bool filesArrive_ = false;
    bool socketIsFull_ = false;
    bool overflowed_ = false;

    std::atomic<std::uint32_t> unfinishedCalls_ = 0;
    std::atomic<std::size_t> unfinishedBytes_ = 0;
    const Sum unfinishedOfAll_;
    std::atomic<bool> paused_ = false;
    SocketPoller& poller_;
    const std::uint64_t key_;
};

} // namespace tarn
