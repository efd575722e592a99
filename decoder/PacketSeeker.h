#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Container.h"
#include "decoder/FlacSearch.h"
#include "decoder/PacketTimeline.h"

namespace tarn {

/// Moves a container to a packet before a frame, in the way that its format asks for.
///
/// Most containers have a table or can be searched. Files that are nothing but frames (MP3, AAC in ADTS,
/// WavPack) have to be walked through once, up to the place that is sought; FFmpeg remembers the way. That
/// may take seconds, so it is done piece by piece.
class PacketSeeker {
public:
    PacketSeeker(Container& container, const PacketTimeline& timeline, ByteSource& source,
                 const AVPacket& first);

    /// Begins to go to the last packet at or before `frame`, or to one not much earlier.
    void begin(std::int64_t frame);

    /// Goes on for a tenth of a second at most. True when it has arrived, or cannot get any further.
    bool proceed();

private:
    bool isKnown(std::int64_t time) const;

    Container& container_;
    const PacketTimeline& timeline_;
    std::optional<FlacSearch> flac_;
    bool walked_ = false; // files of this format are to be walked through
    bool walking_ = false;
    std::int64_t target_ = 0;
};

} // namespace tarn
