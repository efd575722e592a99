#include "decoder/Samples.h"

#include <cstdint>
#include <cstring>

namespace tarn {

namespace {

std::int16_t converted(std::uint8_t sample) { return static_cast<std::int16_t>((sample - 128) * 256); }
std::int16_t converted(std::int16_t sample) { return sample; }
std::int32_t converted(std::int32_t sample) { return sample; }
float converted(float sample) { return sample; }
float converted(double sample) { return static_cast<float>(sample); }

template <class Sample>
void append(const AVFrame& frame, int first, int count, bool planar, PcmBuffer& buffer) {
    using Result = decltype(converted(Sample{}));
    const int channels = frame.ch_layout.nb_channels;
    const std::size_t size = buffer.bytes.size();
    const auto samples = static_cast<std::size_t>(count) * static_cast<std::size_t>(channels);
    buffer.bytes.resize(size + samples * sizeof(Result));
    auto* into = reinterpret_cast<Result*>(buffer.bytes.data() + size);

    const int stride = planar ? 1 : channels;
    for (int channel = 0; channel < channels; ++channel) {
        const auto* from = reinterpret_cast<const Sample*>(frame.extended_data[planar ? channel : 0]) +
                           static_cast<std::ptrdiff_t>(first) * stride + (planar ? 0 : channel);
        for (int i = 0; i < count; ++i)
            into[static_cast<std::ptrdiff_t>(i) * channels + channel] =
                converted(from[static_cast<std::ptrdiff_t>(i) * stride]);
    }
}

} // namespace

SampleFormat decodedSampleFormat(AVSampleFormat format) {
    switch (av_get_packed_sample_fmt(format)) {
    case AV_SAMPLE_FMT_U8:
    case AV_SAMPLE_FMT_S16:
        return SampleFormat::s16;
    case AV_SAMPLE_FMT_S32:
        return SampleFormat::s32;
    default:
        return SampleFormat::f32;
    }
}

void appendInterleaved(const AVFrame& frame, int first, int count, const PcmFormat& format,
                       PcmBuffer& buffer) {
    const auto sampleFormat = static_cast<AVSampleFormat>(frame.format);
    const bool planar = av_sample_fmt_is_planar(sampleFormat) != 0;
    const AVSampleFormat packed = av_get_packed_sample_fmt(sampleFormat);
    if (!planar && packed != AV_SAMPLE_FMT_U8 && packed != AV_SAMPLE_FMT_DBL) {
        const std::size_t frameSize = format.bytesPerFrame();
        const auto* from = reinterpret_cast<const std::byte*>(frame.extended_data[0]) +
                           static_cast<std::size_t>(first) * frameSize;
        return buffer.append(from, static_cast<std::size_t>(count), frameSize);
    }
    if (packed == AV_SAMPLE_FMT_U8) {
        append<std::uint8_t>(frame, first, count, planar, buffer);
    } else if (packed == AV_SAMPLE_FMT_S16) {
        append<std::int16_t>(frame, first, count, planar, buffer);
    } else if (packed == AV_SAMPLE_FMT_S32) {
        append<std::int32_t>(frame, first, count, planar, buffer);
    } else if (packed == AV_SAMPLE_FMT_FLT) {
        append<float>(frame, first, count, planar, buffer);
    } else if (packed == AV_SAMPLE_FMT_DBL) {
        append<double>(frame, first, count, planar, buffer);
    }
    buffer.frames += static_cast<std::size_t>(count);
}

} // namespace tarn
