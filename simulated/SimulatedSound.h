#pragma once

#include <chrono>
#include <cstdint>

#include "pcm/PcmFormat.h"

namespace tarn {

class SimulatedMediaAsset;

/// What a buffer of the simulated engine holds in place of samples: which stretch of which asset its frames
/// are.
struct SimulatedSound {
    const SimulatedMediaAsset* asset;
    std::chrono::nanoseconds start;
    std::chrono::nanoseconds end;
};

/// A frame takes a microsecond, so that times of the virtual clock are hit exactly.
inline constexpr std::chrono::nanoseconds simulatedFrame = std::chrono::microseconds(1);
inline constexpr PcmFormat simulatedFormat{.sample = SampleFormat::s16, .rate = 1'000'000, .channels = 1};

} // namespace tarn
