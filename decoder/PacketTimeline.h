#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Container.h"

namespace tarn {

/// Says of each packet which frames of the decoder's raw output it makes.
///
/// Time stamps alone do not: in Matroska they are milliseconds, after a seek in a WAV or AIFF file with
/// compressed audio they are derived from a rounded bit rate, and in Ogg only one packet of a page has one.
/// So the place is taken from what is exact: the number that a FLAC frame carries, the place in the file
/// where all blocks have one size, or the grid on which packets of constant length lie.
class PacketTimeline {
public:
    PacketTimeline() = default;
    PacketTimeline(const Container& container, const AVPacket& first);

    /// Frame at which the first packet begins; below zero when the encoder's delay precedes time zero.
    std::int64_t first() const { return first_; }

    /// Frames at the beginning that the container says are not to be heard.
    std::int64_t skipped() const { return skipped_; }

    /// Frame at which `packet` begins; none when nothing tells.
    std::optional<std::int64_t> begin(const AVPacket& packet) const;

    /// The number that a FLAC stream itself has for `frame`.
    std::int64_t flacNumber(std::int64_t frame) const { return frame - flacOffset_; }

    /// How many frames it makes, as exactly as can be known without decoding it.
    std::int64_t length(const AVPacket& packet);

private:
    struct VorbisDelete {
        void operator()(AVVorbisParseContext* context) const { av_vorbis_parse_free(&context); }
    };

    void findVorbisBlocks();
    void findFlacNumbers(const AVPacket& first);
    void findBlocks(const AVPacket& first);
    std::int64_t onGrid(std::int64_t frame) const;

    const Container* container_ = nullptr;
    std::int64_t first_ = 0;
    std::int64_t skipped_ = 0;
    std::int64_t tick_ = 0; // of the time stamps, in frames
    std::int64_t grid_ = 0; // where the stamps are coarse: what the packets' lengths are multiples of

    std::unique_ptr<AVVorbisParseContext, VorbisDelete> vorbis_; // where the stamps are coarse

    std::int64_t flacBlockSize_ = 0;
    std::int64_t flacOffset_ = 0; // of the frames' own numbers

    std::int64_t blockFrames_ = 0; // where the place in the file tells the place in time
    std::int64_t firstBlock_ = 0;
};

/// What the container writes beside a packet about frames to leave out at its ends.
struct PacketTrim {
    std::int64_t start = 0;
    std::int64_t end = 0;
};
PacketTrim trimOf(const AVPacket& packet);

} // namespace tarn
