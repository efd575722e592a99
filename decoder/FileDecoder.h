#pragma once

#include "decoder/ByteSource.h"
#include "decoder/Container.h"
#include "decoder/Decoder.h"
#include "decoder/PacketSeeker.h"
#include "decoder/PacketTimeline.h"
#include "mediaprotocol/AudioFileInfo.h"

namespace tarn {

/// Decodes one file; exact to the frame after every seek, because it goes to a packet well before the target
/// and drops what it decodes until it is there. A read() that takes long returns without frames, and the
/// next one goes on.
class FileDecoder final : public Decoder {
public:
    FileDecoder(ByteSource& source, const AudioFileInfo& info);

    /// Why the file could not be opened; the decoder is of no use then.
    std::optional<Error> open();

    void seek(std::int64_t frame) override;
    State read(PcmBuffer& buffer, std::size_t maxFrames) override;
    const Error& error() const override { return error_; }

private:
    enum class Step { frame, ended, failed, unfinished };

    void moveTo(std::int64_t frame);
    Step decode(const WorkLimit& limit);
    Step feed();
    Step failDamaged(int result);
    bool decodedFormatHolds() const;
    bool placeDecodedFrame();
    std::size_t take(PcmBuffer& buffer, std::size_t frames);
    State finish();
    Step fail(Error error);

    ByteSource& source_;
    const AudioFileInfo info_;
    Container container_;
    PacketTimeline timeline_;
    std::optional<PacketSeeker> seeker_;
    FfmpegPointer<AVCodecContext> codec_;
    FfmpegPointer<AVFrame> frame_;

    // All in frames of the decoder's raw output.
    std::int64_t position_ = 0;   // of the next frame to hand out
    std::int64_t end_ = 0;        // where the audible part ends
    std::int64_t frameStart_ = 0; // of frame_
    std::int64_t decodedEnd_ = 0; // where what was decoded so far ends
    std::int64_t silence_ = 0;    // frames of a hole in the file, still to hand out

    bool placed_ = false; // decodedEnd_ is known: every frame follows the one before it
    bool draining_ = false;
    int badPackets_ = 0; // in a row
    int retries_ = 0;    // of the seek in progress
    std::int64_t preroll_ = 0;
    Error error_;
};

} // namespace tarn
