#pragma once

#include <chrono>

#include "roles/MediaTime.h"

namespace tarn {

/// The farthest position that anything is taken to: some 146 years.
inline constexpr std::chrono::nanoseconds farthestPosition{std::chrono::nanoseconds::max() / 2};

/// A numeric time in nanoseconds, rounded down, between plus and minus farthestPosition.
std::chrono::nanoseconds nanosecondsOf(const MediaTime& time);

MediaTime mediaTimeOf(std::chrono::nanoseconds time);

} // namespace tarn
