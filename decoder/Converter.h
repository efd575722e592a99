#pragma once

#include <cstdint>
#include <vector>

#include "decoder/Ffmpeg.h"
#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// Sample format, rate and channels by FFmpeg's resampler. Widening integers, or turning them into floats,
/// keeps every sample's value exactly.
class Converter {
public:
    Converter(const PcmFormat& from, const PcmFormat& to);

    /// Appends to `out` what `in` makes now; the converter holds some frames back.
    void convert(const PcmBuffer& in, PcmBuffer& out);

    /// Appends what was held back; only reset() may follow.
    void drain(PcmBuffer& out);

    /// Begins a new stream.
    void reset();

private:
    void run(const std::uint8_t* data, int frames, PcmBuffer& out);

    const PcmFormat from_;
    const PcmFormat to_;
    FfmpegPointer<SwrContext> resampler_;
};

} // namespace tarn
