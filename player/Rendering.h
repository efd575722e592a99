#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"
#include "roles/Error.h"

namespace tarn {

class MediaAsset;

/// What one render() made: `frames` output frames that play the media from `start` to `end`.
///
/// Spans join: the next one starts where this one ends, and the media moves evenly within a span, so that the
/// position of every frame follows.
struct RenderedSpan {
    enum class State {
        more,    ///< the item goes on behind this span, which holds at least one frame
        waiting, ///< nothing is at hand behind this span for now; the rendering says when it goes on
        ended,   ///< this span is the item's last (its first, when playing backwards); it may hold no frames
        failed,  ///< the item cannot go on behind this span; `error` says why
    };

    std::size_t frames = 0;
    std::chrono::nanoseconds start{0};
    std::chrono::nanoseconds end{0};
    State state = State::more;
    std::optional<Error> error;
};

/// How far the opening of an item has come.
struct Opening {
    bool done = true;
    std::optional<Error> error; ///< why the item cannot be rendered; it is done then, too
};

/// One item on its way to becoming output frames: decoding, conversion and time-stretching behind one
/// interface.
///
/// Made, used and destroyed on the player thread. Exists for the current item and the next one only.
class Rendering {
public:
    virtual ~Rendering() = default;

    /// Until it is done render() answers `waiting`, and the factory's `goesOn` is called when it is.
    virtual Opening opening() const { return {}; }

    /// Goes on exactly at `position` of the media (clamped to its length) with the playback rate `rate`
    /// (finite, never 0; below 0 is backwards), in frames of `format`. Precedes the first render(), and comes
    /// again whenever one of the three is not what the span before led to.
    ///
    /// A rate beyond what can be rendered is rendered as fast or as slow as it can be; the spans tell.
    virtual void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) = 0;

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

    /// Opens `asset`, or begins to: its item is ready to play when opening() is done. Nothing is decoded for
    /// the ear yet. `goesOn` is called on the player thread, outside render(), when the opening is done if it
    /// was not, and each time that a rendering which answered `waiting` has more; never after the rendering's
    /// end.
    virtual Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) = 0;
};

} // namespace tarn
