#pragma once

#include <cstdint>
#include <deque>
#include <span>

#include "ipc/Frame.h"
#include "roles/Data.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// The frames that a socket has not taken yet, in order, with the files that go along. Not thread-safe.
class Outgoing {
public:
    /// What came of a flush().
    enum class Result { empty, socketIsFull, peerIsGone };

    /// The body is at most FrameHeader::largestBody long. A file goes with the frame's first byte.
    void append(FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body,
                FileDescriptor file = {});

    /// Gives the socket what it takes now, without waiting and without a signal.
    Result flush(int socket);

    /// Bytes that wait.
    std::size_t size() const { return size_; }

    void clear();

private:
    struct Part {
        Data bytes;
        FileDescriptor file;
        std::size_t sent = 0; // of the bytes
    };

    std::deque<Part> parts_; // another one begins with each file, and when one is long
    std::size_t size_ = 0;
};

} // namespace tarn
