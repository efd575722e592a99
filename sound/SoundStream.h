#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "pcm/PcmFormat.h"

namespace tarn {

/// Is told what happens to a stream. Player thread; the stream may be destroyed from inside.
class SoundStreamListener {
public:
    virtual ~SoundStreamListener() = default;

    virtual void streamReady() = 0;

    /// The stream is dead, while the server lives: its device is gone and there is no other.
    virtual void streamKilled() = 0;

    /// The device that the stream was heard on is gone. What it plays from now on comes out elsewhere.
    virtual void streamDeviceVanished() = 0;

    /// Somebody has moved the stream to another device: what was known of its clock does not hold any more.
    virtual void streamMoved() = 0;

    /// The answer to updateTiming() is there.
    virtual void streamTimingUpdated() = 0;

    /// The server wants this stream to be silent for something more important, or takes that back.
    virtual void streamToBeInterrupted() = 0;
    virtual void streamToBeReleased() = 0;
};

/// One playback stream, stopped when made. Frames are counted from the stream's own beginning. Player thread.
/// No call waits for the server.
class SoundStream {
public:
    /// How far the server has come with the stream, as it was at `time`.
    struct Timing {
        std::int64_t writeIndex = 0;          ///< where the next write will go
        std::int64_t readIndex = 0;           ///< frames before this one have left for the device
        std::chrono::microseconds latency{0}; ///< how long the frame at readIndex takes to the ear
        std::chrono::nanoseconds time{0};     ///< by the steady clock
        std::int64_t silence = 0;             ///< frames of silence that left after the stream ran dry
        bool playing = false;                 ///< at least a part of it is on its way to the ear
    };

    virtual ~SoundStream() = default;

    /// Nothing is told to the listener before any more. `listener` outlives the stream.
    virtual void setListener(SoundStreamListener& listener) = 0;

    virtual bool ready() const = 0;
    virtual const PcmFormat& format() const = 0;

    /// How many frames it takes ahead of the ear.
    virtual std::size_t capacity() const = 0;

    /// Stops the stream, which keeps what was not heard yet, or lets it go on.
    virtual void cork(bool stopped) = 0;

    /// Appends behind what was written last.
    virtual void write(const std::byte* data, std::size_t frames) = 0;

    /// Overwrites from `frame` on. What has left for the device already stays as it is, unless takesBack().
    virtual void writeAt(std::int64_t frame, const std::byte* data, std::size_t frames) = 0;

    /// Overwrites from where the server reads, but for `margin` frames.
    virtual void writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) = 0;

    /// Whether the device gives back frames that have left for it, so that they can be overwritten until
    /// shortly before they are heard. Unknown until something was overwritten and a timing has come.
    enum class TakesBack : std::uint8_t { unknown, no, yes };
    virtual TakesBack takesBack() const = 0;

    virtual void updateTiming() = 0;

    /// None before the first update.
    virtual std::optional<Timing> timing() const = 0;

    /// What people read in mixers and device menus.
    virtual void setDescription(const std::string& title, const std::string& artist) = 0;
};

} // namespace tarn
