#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"
#include "roles/Error.h"

namespace tarn {

/// Is told by an output what happens to it. Called on the player thread, never inside a call of the output.
class OutputListener {
public:
    virtual ~OutputListener() = default;

    /// The room has come to half a buffer. Comes once; again only when something was written since.
    virtual void outputIsWritable() = 0;

    /// The stream broke off and begins anew (sound server gone, back, another format): what was written and
    /// not yet heard is lost, and format() may differ. The count of frames goes on: writeIndex() is now the
    /// frame that would have been heard next. The player renders again from there.
    virtual void outputWasReset() = 0;

    /// Its clock was off, or has only begun to run: timeOfFrame() answers differently now.
    virtual void outputClockMoved() = 0;

    /// The device that sounded is gone; what is played from now on would come out of another one.
    virtual void outputDeviceVanished(const Error& error) = 0;

    /// Sound is wanted and goes nowhere because of `error`, though time passes; or, without an error, is
    /// heard again.
    virtual void outputSoundChanged(const std::optional<Error>& error) = 0;
};

/// One stream to the listener's ears: a buffer of about two seconds, and a clock of what is heard. Stopped
/// when made.
///
/// Frames are counted from 0 since the output was made. When what was written has been heard, the clock
/// stands at writeIndex() until more is written; that is no error. Player thread, except where stated. No
/// call waits for the sound server or calls the listener. Destroying it silences it without waiting.
class Output {
public:
    /// How frames that are written follow on those before them.
    enum class Join {
        cut,     ///< as they are, sample for sample
        blended, ///< over a few milliseconds mixed with the frames that were taken back, so that nothing
                 ///< clicks
    };

    virtual ~Output() = default;

    /// What it takes now; changes only together with outputWasReset().
    virtual PcmFormat format() const = 0;

    /// Sound runs / stands still (the buffer is kept). Started, it sounds as soon as anything is written,
    /// however little. Standing still, no stream runs and nothing wakes up.
    virtual void start() = 0;
    virtual void stop() = 0;

    /// Next frame to be written.
    virtual std::int64_t writeIndex() const = 0;

    /// How many frames the buffer takes now.
    virtual std::size_t writable() const = 0;

    /// At most writable() frames.
    virtual void write(const PcmBuffer& buffer) = 0;

    /// The first frame that can still be taken back, at most writeIndex(): what lies before it is, or may
    /// already be, on its way to the ear. Leaves the player time to render what replaces it.
    virtual std::int64_t firstReplaceable() const = 0;

    /// Takes back everything from `index` (at least firstReplaceable(), at most writeIndex()) on; writing
    /// goes on there, and so does the clock in case that the ear has been quicker. `join` is about the frames
    /// that are written next.
    virtual void rewind(std::int64_t index, Join join) = 0;

    /// Any thread: the frame that is heard now (all before it were heard), output latency taken off, at most
    /// writeIndex(). Never goes back; frozen while stopped. Takes no lock that is held for long.
    virtual std::int64_t heardFrame() const = 0;

    /// When heardFrame() will have reached `index`, by the clock of the player loop, if sound runs on.
    virtual std::chrono::nanoseconds timeOfFrame(std::int64_t index) const = 0;

    /// What the listener reads in mixers and device menus.
    virtual void setDescription(const std::string& title, const std::string& artist) = 0;
};

/// Makes outputs. Player thread.
class OutputFactory {
public:
    virtual ~OutputFactory() = default;

    /// An item is ready, so an output will soon be asked for: what takes its time can be done now. May come
    /// as often as one likes.
    virtual void prepare() {}

    /// Never fails: without a sound server the output is silent and keeps time. `listener` outlives the
    /// output.
    virtual std::unique_ptr<Output> create(OutputListener& listener) = 0;
};

} // namespace tarn
