#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "platform/core/media/PcmBuffer.h"
#include "platform/core/media/PcmFormat.h"

struct pa_context;
struct pa_operation;
struct pa_stream;

namespace tarn {

/// Is told what happens to a stream. Player thread; the stream may be destroyed from inside.
class PulseStreamListener {
public:
    virtual ~PulseStreamListener() = default;

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
/// beginning. Player thread.
class PulseStream {
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

    /// A stream with a buffer of `bufferFrames`. `listener` outlives it.
    PulseStream(pa_context* context, const PcmFormat& format, std::size_t bufferFrames,
                PulseStreamListener& listener);
    ~PulseStream();

    bool ready() const { return ready_; }
    const PcmFormat& format() const { return format_; }

    void cork(bool stopped);

    /// Appends behind what was written last.
    void write(const std::byte* data, std::size_t frames);

    /// Overwrites from `frame` on.
    void writeAt(std::int64_t frame, const std::byte* data, std::size_t frames);

    /// Overwrites from where the server reads, but for `margin` frames.
    void writeSoon(std::size_t margin, const std::byte* data, std::size_t frames);

    void updateTiming();

    /// None before the first update.
    std::optional<Timing> timing() const;

    void setDescription(const std::string& title, const std::string& artist);

private:
    struct Callbacks;
    struct CallSurvey;
    struct StreamDelete {
        void operator()(pa_stream* stream) const;
    };
    struct OperationDelete {
        void operator()(pa_operation* operation) const;
    };

    void write(const std::byte* data, std::size_t frames, std::int64_t offset, int seek);
    void checkOldDevice();
    void askForCalls();

    const PcmFormat format_;
    PulseStreamListener& listener_;
    std::unique_ptr<pa_stream, StreamDelete> stream_;
    std::unique_ptr<pa_operation, OperationDelete>
        timingQuery_; // not answered any more when the stream is gone
    bool ready_ = false;
    std::uint32_t device_ = 0;
    std::shared_ptr<PulseStream*> self_; // for answers that come when the stream is gone
};

} // namespace tarn
