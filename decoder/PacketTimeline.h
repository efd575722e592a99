#pragma once

#include <cstdint>

#include "decoder/Container.h"

namespace tarn {

/// Turns a stream's time stamps into frames of the decoder's raw output.
///
/// Where the stamps are coarser than a frame (milliseconds in Matroska), packets of constant length put them
/// back on their grid.
class PacketTimeline {
public:
    PacketTimeline() = default;
    PacketTimeline(const Container& container, const AVPacket& first);

    /// Frame at which the first packet begins; below zero when the encoder's delay precedes time zero.
    std::int64_t first() const { return first_; }

    /// Frames at the beginning that the container says are not to be heard.
    std::int64_t skipped() const { return skipped_; }

    std::int64_t frameAt(std::int64_t timestamp) const;

private:
    const Container* container_ = nullptr;
    std::int64_t first_ = 0;
    std::int64_t skipped_ = 0;
    std::int64_t grid_ = 0;
};

/// What the container writes beside a packet about frames to leave out at its ends.
struct PacketTrim {
    std::int64_t start = 0;
    std::int64_t end = 0;
};
PacketTrim trimOf(const AVPacket& packet);

} // namespace tarn
