#include "sound/HeardClock.h"

#include <algorithm>
#include <cmath>

namespace tarn {

namespace {

constexpr std::chrono::hours unknown{1};

}

void HeardClock::setRate(std::uint32_t rate) {
    std::lock_guard lock(mutex_);
    rate_ = rate;
    state_ = State::awaited;
    frame_ = last_;
}

void HeardClock::run(std::int64_t frame, Time time) {
    std::lock_guard lock(mutex_);
    state_ = State::running;
    frame_ = frame;
    time_ = time;
}

void HeardClock::stop(Time now) { stand(State::stopped, now); }

void HeardClock::await(Time now) { stand(State::awaited, now); }

void HeardClock::stand(State state, Time now) {
    std::lock_guard lock(mutex_);
    frame_ = heardLocked(now);
    state_ = state;
}

void HeardClock::setLimit(std::int64_t frame) {
    std::lock_guard lock(mutex_);
    limit_ = frame;
}

std::int64_t HeardClock::heardLocked(Time now) const {
    std::int64_t frame = frame_;
    if (state_ == State::running)
        frame +=
            static_cast<std::int64_t>(std::floor(static_cast<double>((now - time_).count()) * 1e-9 * rate_));
    last_ = std::max(last_, std::min(frame, limit_));
    return last_;
}

std::int64_t HeardClock::heard(Time now) const {
    std::lock_guard lock(mutex_);
    return heardLocked(now);
}

HeardClock::Time HeardClock::timeOf(std::int64_t frame, Time now) const {
    std::lock_guard lock(mutex_);
    if (state_ == State::stopped)
        return now + unknown;
    const Time from = state_ == State::running ? time_ : now;
    return from + Time(std::llround(std::ceil(static_cast<double>(frame - frame_) * 1e9 / rate_)));
}

} // namespace tarn
