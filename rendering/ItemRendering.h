#pragma once

#include <chrono>
#include <optional>

#include "mediaprotocol/AudioFileInfo.h"
#include "mediaprotocol/MediaSpan.h"
#include "rendering/BackwardSource.h"
#include "rendering/ForwardSource.h"
#include "rendering/Stretcher.h"

namespace tarn {

/// One file as output frames: decoded, converted, turned around for negative rates, stretched for rates other
/// than 1. At rate 1 and the file's own format nothing touches the samples. Used by one thread.
class ItemRendering {
public:
    /// `decoder` outlives the rendering.
    ItemRendering(Decoder& decoder, AudioFileInfo info);

    /// Goes on exactly at `position` of the media (clamped to its length) with the playback rate `rate`
    /// (below 0 is backwards), in frames of `format`. Precedes the first render().
    ///
    /// A rate beyond what can be rendered is rendered as fast or as slow as it can be; the spans tell.
    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format);

    /// Appends at most `maxFrames` output frames to `buffer`, at least one unless the span is the last.
    MediaSpan render(PcmBuffer& buffer, std::size_t maxFrames);

    /// Meaningful after a span that failed.
    const Error& error() const { return decoder_.error(); }

private:
    void fillStretched(std::size_t frames);
    void takeStretched(PcmBuffer& buffer, std::size_t maxFrames);
    std::int64_t timeOf(double frame) const;
    std::int64_t endTime() const;

    Decoder& decoder_;
    const AudioFileInfo info_;

    PcmFormat format_;
    std::optional<ForwardSource> forward_;
    std::optional<BackwardSource> backward_;
    FrameSource* source_ = nullptr; // the one of the two that is in use
    std::optional<Stretcher> stretcher_;

    double speed_ = 1;          // frames of media per frame of output; below 0 backwards
    double start_ = 0;          // frame of media at which the last seek() went on
    std::int64_t rendered_ = 0; // frames of output since then
    Decoder::State state_ = Decoder::State::more;
    PcmBuffer piece_;
    PcmBuffer stretched_;
    std::size_t taken_ = 0; // of stretched_, in frames
};

} // namespace tarn
