#pragma once

#include <pulse/channelmap.h>
#include <pulse/sample.h>

#include <algorithm>

#include "pcm/PcmFormat.h"

namespace tarn {

inline pa_sample_spec specOf(const PcmFormat& format) {
    pa_sample_format_t sample = PA_SAMPLE_FLOAT32NE;
    if (format.sample == SampleFormat::s16)
        sample = PA_SAMPLE_S16NE;
    else if (format.sample == SampleFormat::s24In32)
        sample = PA_SAMPLE_S24_32NE;
    else if (format.sample == SampleFormat::s32)
        sample = PA_SAMPLE_S32NE;
    return {sample, format.rate, static_cast<std::uint8_t>(format.channels)};
}

/// The format that carries every sample of a device with `spec`.
inline PcmFormat formatOf(const pa_sample_spec& spec) {
    SampleFormat sample = SampleFormat::s16;
    switch (spec.format) {
    case PA_SAMPLE_FLOAT32LE:
    case PA_SAMPLE_FLOAT32BE:
        sample = SampleFormat::f32;
        break;
    case PA_SAMPLE_S32LE:
    case PA_SAMPLE_S32BE:
        sample = SampleFormat::s32;
        break;
    case PA_SAMPLE_S24LE:
    case PA_SAMPLE_S24BE:
    case PA_SAMPLE_S24_32LE:
    case PA_SAMPLE_S24_32BE:
        sample = SampleFormat::s24In32;
        break;
    default:
        break;
    }
    return {sample, spec.rate, std::clamp<std::uint32_t>(spec.channels, 1, 8)};
}

/// The order in which the decoder's channels come.
inline pa_channel_map channelMapOf(const PcmFormat& format) {
    pa_channel_map map;
    pa_channel_map_init_extend(&map, format.channels, PA_CHANNEL_MAP_WAVEEX);
    return map;
}

} // namespace tarn
