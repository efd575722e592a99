#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>

#include "platform/core/media/PcmBuffer.h"
#include "platform/core/media/PcmFormat.h"

namespace tarn {

/// Is told by an output what happens to it. Called on the player thread.
class OutputListener {
public:
    virtual ~OutputListener() = default;

    /// There is room for at least half a buffer again.
    virtual void outputIsWritable() = 0;

    /// The output's clock or format begins anew (sound server gone, back, another format): frames counts
    /// restart at 0 and all that was written is lost. The player re-renders from the last heard position.
    virtual void outputWasReset() = 0;

    /// The device that sounded is gone, and the output will not fall on to another by itself.
    virtual void outputDeviceVanished() = 0;
};

/// One stream to the listener's ears: a buffer of about two seconds, and a clock of what is heard. Stopped
/// when made.
///
/// Frames are counted from 0 since the output was made or reset. Player thread, except where stated.
/// Destroying it silences it without waiting.
class Output {
public:
    virtual ~Output() = default;

    virtual PcmFormat format() const = 0;

    /// Sound runs / stands still (the buffer is kept). Standing still, no stream runs and nothing wakes up.
    virtual void start() = 0;
    virtual void stop() = 0;

    /// Next frame to be written.
    virtual std::int64_t writeIndex() const = 0;

    /// How many frames the buffer takes now.
    virtual std::size_t writable() const = 0;

    virtual void write(const PcmBuffer& buffer) = 0;

    /// The first frame that can still be taken back: what lies before it is, or may already be, on its way to
    /// the ear.
    virtual std::int64_t firstReplaceable() const = 0;

    /// Takes back everything from `index` (at least firstReplaceable()) on; writing goes on there.
    virtual void rewind(std::int64_t index) = 0;

    /// Any thread: the frame that is heard now, output latency taken off. Monotonic while running, frozen
    /// while stopped.
    virtual std::int64_t heardFrame() const = 0;

    /// When `index` will be heard, by the platform's clock, if sound runs on; for timers.
    virtual std::chrono::nanoseconds timeOfFrame(std::int64_t index) const = 0;

    /// What the listener reads in mixers and device menus.
    virtual void setDescription(const std::string& title, const std::string& artist) = 0;
};

/// Makes outputs. Player thread.
class OutputFactory {
public:
    virtual ~OutputFactory() = default;

    /// Never fails: without a sound server the output is silent and keeps time. `listener` outlives the
    /// output.
    virtual std::unique_ptr<Output> create(OutputListener& listener) = 0;
};

} // namespace tarn
