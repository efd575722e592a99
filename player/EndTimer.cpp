#include "player/EndTimer.h"

#include <algorithm>
#include <utility>

namespace tarn {

namespace {

using std::chrono::nanoseconds;

constexpr nanoseconds tolerance = std::chrono::milliseconds(1);
constexpr nanoseconds longestRetry = std::chrono::seconds(1);

} // namespace

void EndTimer::set(const Output& output, std::int64_t frame) {
    nanoseconds time = output.timeOfFrame(frame);
    if (std::exchange(frame_, frame) != frame) {
        heardAtCall_ = -1;
    } else if (pending_) {
        if (time > time_ - tolerance && time < time_ + tolerance)
            return;
    } else { // it has called, but too early
        std::int64_t heard = output.heardFrame();
        bool stands = std::exchange(heardAtCall_, heard) == heard;
        retry_ = stands ? std::min(2 * retry_, longestRetry) : tolerance;
        time = std::max(time, loop_.now() + retry_);
    }
    arm(time);
}

void EndTimer::cancel() {
    timer_.reset();
    pending_ = false;
    frame_ = -1;
}

void EndTimer::arm(nanoseconds time) {
    time_ = time;
    pending_ = true;
    timer_ = loop_.at(time, [this] {
        pending_ = false;
        call_();
    });
}

} // namespace tarn
