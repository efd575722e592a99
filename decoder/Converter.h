#pragma once

#include <cstdint>
#include <vector>

#include "decoder/Decoder.h"
#include "decoder/Ffmpeg.h"

namespace tarn {

/// Sample format, rate and channels by FFmpeg's resampler. Widening integers, or turning them into floats,
/// keeps every sample's value exactly.
class Converter final : public SampleConverter {
public:
    Converter(const PcmFormat& from, const PcmFormat& to);

    void convert(const PcmBuffer& in, PcmBuffer& out) override;
    void drain(PcmBuffer& out) override;
    void reset() override;

private:
    void run(const std::uint8_t* data, int frames, PcmBuffer& out);

    const PcmFormat from_;
    const PcmFormat to_;
    FfmpegPointer<SwrContext> resampler_;
};

} // namespace tarn
