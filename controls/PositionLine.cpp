#include "controls/PositionLine.h"

#include <algorithm>

namespace tarn {

namespace {

/// Far beyond any recording, and exact as a double.
constexpr std::int64_t longest = std::int64_t{1} << 53;

} // namespace

PositionLine::PositionLine(Microseconds elapsed, Time start, double rate, std::optional<Microseconds> length)
    : start_(start), rate_(rate), length_(length) {
    elapsed_ = clamped(static_cast<double>(elapsed.count()));
}

PositionLine::Microseconds PositionLine::at(Time now) const {
    const std::chrono::duration<double, std::micro> passed = now - start_;
    return clamped(static_cast<double>(elapsed_.count()) + passed.count() * rate_);
}

PositionLine::Microseconds PositionLine::clamped(double microseconds) const {
    const std::int64_t end = length_ ? std::min(length_->count(), longest) : longest;
    return Microseconds(static_cast<std::int64_t>(std::clamp(microseconds, 0.0, static_cast<double>(end))));
}

} // namespace tarn
