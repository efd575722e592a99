#pragma once

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <vector>

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"
#include "tests/support/AudioFixture.h"

namespace tarn {

/// Every sample of a buffer, from -1 to 1.
inline std::vector<float> toFloats(const PcmBuffer& buffer, SampleFormat format) {
    std::vector<float> result;
    const std::size_t size = format == SampleFormat::s16 ? 2 : 4;
    for (std::size_t at = 0; at + size <= buffer.bytes.size(); at += size) {
        std::int16_t small = 0;
        std::int32_t large = 0;
        float real = 0;
        const std::byte* from = buffer.bytes.data() + at;
        switch (format) {
        case SampleFormat::s16:
            std::memcpy(&small, from, sizeof small);
            result.push_back(static_cast<float>(small) / 32768.0F);
            break;
        case SampleFormat::f32:
            std::memcpy(&real, from, sizeof real);
            result.push_back(real);
            break;
        case SampleFormat::s24In32:
        case SampleFormat::s32:
            std::memcpy(&large, from, sizeof large);
            result.push_back(static_cast<float>(large) /
                             (format == SampleFormat::s32 ? 2147483648.0F : 8388608.0F));
            break;
        }
    }
    return result;
}

inline std::vector<float> toFloats(const Recording& recording) {
    std::vector<float> result;
    for (const std::int16_t sample : recording.samples)
        result.push_back(static_cast<float>(sample) / 32768.0F);
    return result;
}

/// Mean square of the difference between `part` and what stands in `whole` from frame `at` on.
inline double difference(const std::vector<float>& part, const std::vector<float>& whole, std::int64_t at,
                         std::size_t channels) {
    double sum = 0;
    for (std::size_t i = 0; i < part.size(); ++i) {
        const std::int64_t index = at * static_cast<std::int64_t>(channels) + static_cast<std::int64_t>(i);
        const float other = index >= 0 && index < static_cast<std::int64_t>(whole.size())
                                ? whole[static_cast<std::size_t>(index)]
                                : 0.0F;
        sum += (part[i] - other) * (part[i] - other);
    }
    return sum / static_cast<double>(part.size());
}

/// By how many frames `part` lies away from frame `at` of `whole`, within `range`.
inline std::int64_t displacement(const std::vector<float>& part, const std::vector<float>& whole,
                                 std::int64_t at, std::size_t channels, std::int64_t range) {
    std::int64_t best = 0;
    double least = std::numeric_limits<double>::max();
    for (std::int64_t shift = -range; shift <= range; ++shift)
        if (const double now = difference(part, whole, at + shift, channels); now < least) {
            least = now;
            best = shift;
        }
    return best;
}

} // namespace tarn
