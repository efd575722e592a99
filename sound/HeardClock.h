#pragma once

#include <chrono>
#include <cstdint>
#include <mutex>

namespace tarn {

/// Which frame is heard now: a line through time that never goes back and never passes what was written. Any
/// thread may ask; the player thread draws the line.
class HeardClock {
public:
    using Time = std::chrono::nanoseconds; ///< of the steady clock

    /// Frames per second. Stands still meanwhile.
    void setRate(std::uint32_t rate);

    /// From now on `frame` is heard at `time`, and the frames after it as time goes on. `time` may lie ahead.
    void run(std::int64_t frame, Time time);

    /// Stands where it is, and will not run by itself.
    void stop(Time now);

    /// Stands where it is, about to run.
    void await(Time now);

    /// Nothing is heard from `frame` on.
    void setLimit(std::int64_t frame);

    std::int64_t heard(Time now) const;

    /// When `frame` will be heard: a guess while it is about to run, a time far ahead while it is stopped.
    Time timeOf(std::int64_t frame, Time now) const;

private:
    enum class State : std::uint8_t { stopped, awaited, running };

    void stand(State state, Time now);
    std::int64_t heardLocked(Time now) const;

    mutable std::mutex mutex_;
    std::uint32_t rate_ = 44100;
    State state_ = State::stopped;
    std::int64_t frame_ = 0;
    Time time_{0};
    std::int64_t limit_ = 0;
    mutable std::int64_t last_ = 0; // what was heard when it was last asked for
};

} // namespace tarn
