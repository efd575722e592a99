#pragma once

#include <chrono>
#include <cstddef>
#include <memory>
#include <optional>

#include "platform/Error.h"
#include "platform/core/media/PcmBuffer.h"
#include "platform/core/media/PcmFormat.h"

namespace tarn {

class MediaAsset;

/// What one render() made: `frames` output frames that play the media from `start` to `end`.
struct RenderedSpan {
    enum class State {
        more,   ///< the item goes on behind this span
        ended,  ///< this span is the item's last (its first, when playing backwards); it may hold no frames
        failed, ///< the item cannot go on behind this span; `error` says why
    };

    std::size_t frames = 0;
    std::chrono::nanoseconds start{0};
    std::chrono::nanoseconds end{0};
    State state = State::more;
    std::optional<Error> error;
};

/// One item on its way to becoming output frames: decoding, conversion and time-stretching behind one
/// interface.
///
/// Made, used and destroyed on the player thread. Exists for the current item and the next one only.
class Rendering {
public:
    virtual ~Rendering() = default;

    /// Goes on exactly at `position` of the media with the playback rate `rate` (never 0; below 0 is
    /// backwards). Must precede the first render(). When only the rate differs from the span before, the
    /// stretcher goes on without a break.
    virtual void seek(std::chrono::nanoseconds position, float rate) = 0;

    /// Appends at most `maxFrames` output frames to `buffer`, fewer when that is what is at hand.
    virtual RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) = 0;
};

/// Opens items for rendering. Player thread.
class RenderingFactory {
public:
    struct Outcome {
        std::unique_ptr<Rendering> rendering;
        std::optional<Error> error; // set when there is no rendering
    };

    virtual ~RenderingFactory() = default;

    /// Rendering of `asset` to frames of the format `output`.
    virtual Outcome open(const std::shared_ptr<MediaAsset>& asset, const PcmFormat& output) = 0;
};

} // namespace tarn
