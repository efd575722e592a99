#pragma once

#include <cstdint>
#include <span>

#include "ipc/Frame.h"
#include "roles/Data.h"

namespace tarn {

/// The frames that a socket has not taken yet, in order. Not thread-safe.
class SendBuffer {
public:
    /// What came of a flush().
    enum class Result { empty, socketIsFull, peerIsGone };

    /// The body is at most FrameHeader::largestBody long.
    void append(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body);

    /// Gives the socket what it takes now, without waiting.
    Result flush(int socket);

    /// Bytes that wait.
    std::size_t size() const { return bytes_.size() - sent_; }

    void clear();

private:
    Data bytes_;
    std::size_t sent_ = 0; // of bytes_
};

} // namespace tarn
