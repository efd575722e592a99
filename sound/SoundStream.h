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

    /// It is dead, while the server lives.
    virtual void streamKilled() = 0;

    /// The device that it was on is gone; the server has moved it to another.
    virtual void streamMovedOffVanishedDevice() = 0;

    /// What updateTiming() asked for.
    virtual void streamTimingUpdated() = 0;

    virtual void streamToBeInterrupted() = 0;
    virtual void streamToBeReleased() = 0;
};

/// One playback stream of the sound server, stopped when made. Frames are counted from the stream's own
/// beginning. Player thread. Nothing waits for the server.
class SoundStream {
public:
    /// What the server said of its clock.
    struct Timing {
        std::int64_t writeIndex = 0;          ///< where the next write will go
        std::int64_t readIndex = 0;           ///< what has left for the device by then
        std::chrono::microseconds latency{0}; ///< from there to the ear
        std::chrono::nanoseconds time{0};     ///< by the steady clock
        std::int64_t silence = 0;             ///< what has left behind it since the stream ran dry
        bool playing = false;                 ///< some of it, or all, is on its way to the ear
    };

    virtual ~SoundStream() = default;

    virtual bool ready() const = 0;
    virtual const PcmFormat& format() const = 0;

    virtual void cork(bool stopped) = 0;

    /// Appends behind what was written last.
    virtual void write(const std::byte* data, std::size_t frames) = 0;

    /// Overwrites from `frame` on.
    virtual void writeAt(std::int64_t frame, const std::byte* data, std::size_t frames) = 0;

    /// Overwrites from where the server reads, but for `margin` frames.
    virtual void writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) = 0;

    virtual void updateTiming() = 0;

    /// None before the first update.
    virtual std::optional<Timing> timing() const = 0;

    virtual void setDescription(const std::string& title, const std::string& artist) = 0;
};

} // namespace tarn
