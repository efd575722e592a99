#pragma once

#include <cmath>
#include <limits>

namespace tarn {

/// Playback rates closer to zero than 2^-23 count as zero. Not-a-number does not.
inline bool isZeroRate(float rate) { return std::fabs(rate) < std::numeric_limits<float>::epsilon(); }

} // namespace tarn
