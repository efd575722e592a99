#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "roles/Data.h"
#include "system/FileReceiver.h"

namespace tarn {

/// What a frame means; the value is its byte on the wire.
enum class FrameKind : std::uint8_t {
    call = 1,
    extension = 2,
    reply = 3,
    released = 4,
    event = 5,
    takenOver = 6, ///< news: another connection is the current one now
    forgotten = 7, ///< news: another connection was lost, and none is the current one now
};

/// The body of a call by which a client asks for the two frames with news of its connection. It is also a
/// valid envelope without a command, so that a service that does not know it releases the call and no more.
inline constexpr std::array<std::uint8_t, 2> askForNews = {0x78, 0x01};

/// What stands before every body: body length (4 bytes), kind (1), zero (3), call id (8), little-endian.
struct FrameHeader {
    static constexpr std::size_t size = 16;
    static constexpr std::size_t largestBody = 1'048'576;

    std::uint32_t bodyLength = 0;
    FrameKind kind = FrameKind::call;
    std::uint64_t callId = 0;

    std::array<std::uint8_t, size> encode() const;

    /// Takes `size` bytes as they are: whether kind and length make sense is the reader's question. None when
    /// a reserved byte is not zero.
    static std::optional<FrameHeader> decode(std::span<const std::uint8_t, size> bytes);
};

/// One whole frame that arrived.
struct Frame {
    FrameKind kind = FrameKind::call;
    std::uint64_t callId = 0;
    Data body;
    ReceivedFile file; // of an extension only
};

/// Appends a whole frame to `bytes`. The body is at most FrameHeader::largestBody long.
void appendFrame(Data& bytes, FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body);

} // namespace tarn
