#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Container.h"
#include "decoder/PacketTimeline.h"
#include "decoder/WorkLimit.h"

namespace tarn {

/// Finds where the audible part of a container begins and ends, in frames of the decoder's raw output: from
/// what the container says where that is exact, else from its last packets, else by reading all of them.
class LengthFinder {
public:
    LengthFinder(Container& container, ByteSource& source) : container_(container), source_(source) {}

    /// False when the file holds no packet of audio.
    bool readFirstPacket();

    std::int64_t firstPacketPosition() const { return position_; }
    const PacketTimeline& timeline() const { return timeline_; }

    /// By the container's own account.
    std::int64_t origin() const;

    /// None when only reading all of a long file would tell, or when reading fails: container.failure().
    std::optional<std::int64_t> end();

    /// About how much there is when end() tells none: by samples of the file, or by its size and bit rate.
    std::optional<std::int64_t> estimate();

    /// Reads packets on to the end. False when the limit comes first.
    bool readOn(const WorkLimit& limit);

    /// Where the last packet read so far ends.
    std::int64_t endOfRead() const { return end_ - discarded_; }

private:
    void note(const AVPacket& packet);
    bool isBareFrames() const;
    bool containerKnows() const;
    std::int64_t endByContainer() const;
    std::optional<std::int64_t> endOfFlac() const;
    std::optional<std::int64_t> endOfTail();

    Container& container_;
    ByteSource& source_;
    PacketTimeline timeline_;
    std::int64_t position_ = -1;
    std::int64_t end_ = 0;
    std::int64_t discarded_ = 0;
    FfmpegPointer<AVPacket> last_; ///< of TTA, that was read
};

} // namespace tarn
