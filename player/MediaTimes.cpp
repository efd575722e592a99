#include "player/MediaTimes.h"

#include <cassert>
#include <cstdint>

namespace tarn {

namespace {

constexpr std::int64_t perSecond = 1'000'000'000;

} // namespace

std::chrono::nanoseconds nanosecondsOf(const MediaTime& time) {
    assert(time.isNumeric());
    constexpr std::int64_t farthestSeconds = farthestPosition.count() / perSecond;
    std::int64_t seconds = time.value() / time.timescale();
    if (seconds >= farthestSeconds)
        return farthestPosition;
    if (seconds <= -farthestSeconds)
        return -farthestPosition;
    std::int64_t rest = time.value() % time.timescale();
    return std::chrono::nanoseconds(seconds * perSecond + rest * perSecond / time.timescale());
}

MediaTime mediaTimeOf(std::chrono::nanoseconds time) {
    return {time.count(), static_cast<std::int32_t>(perSecond)};
}

} // namespace tarn
