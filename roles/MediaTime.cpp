#include "roles/MediaTime.h"

#include <cmath>
#include <limits>

namespace tarn {

MediaTime MediaTime::fromSeconds(double seconds, std::int32_t timescale) {
    if (!std::isfinite(seconds) || timescale <= 0)
        return {};
    // 2^63 is exact as a double; everything at or above it saturates.
    constexpr double end = 9223372036854775808.0;
    double units = std::round(seconds * timescale);
    if (units >= end)
        return {std::numeric_limits<std::int64_t>::max(), timescale};
    if (units < -end)
        return {std::numeric_limits<std::int64_t>::min(), timescale};
    return {static_cast<std::int64_t>(units), timescale};
}

double MediaTime::seconds() const {
    if (!isNumeric())
        return std::numeric_limits<double>::quiet_NaN();
    return static_cast<double>(value_) / timescale_;
}

} // namespace tarn
