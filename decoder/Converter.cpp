#include "decoder/Converter.h"

#include <cassert>
#include <cstring>

namespace tarn {

namespace {

AVSampleFormat packedFormat(SampleFormat format) {
    switch (format) {
    case SampleFormat::s16:
        return AV_SAMPLE_FMT_S16;
    case SampleFormat::s24In32: // converted as s32 and moved down
    case SampleFormat::s32:
        return AV_SAMPLE_FMT_S32;
    case SampleFormat::f32:
        break;
    }
    return AV_SAMPLE_FMT_FLT;
}

void moveDownTo24Bits(std::byte* samples, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i, samples += sizeof(std::int32_t)) {
        std::int32_t value = 0;
        std::memcpy(&value, samples, sizeof value);
        value >>= 8;
        std::memcpy(samples, &value, sizeof value);
    }
}

} // namespace

Converter::Converter(const PcmFormat& from, const PcmFormat& to) : from_(from), to_(to) {
    assert(from.sample != SampleFormat::s24In32);
    AVChannelLayout in;
    AVChannelLayout out;
    av_channel_layout_default(&in, static_cast<int>(from.channels));
    av_channel_layout_default(&out, static_cast<int>(to.channels));
    SwrContext* context = nullptr;
    swr_alloc_set_opts2(&context, &out, packedFormat(to.sample), static_cast<int>(to.rate), &in,
                        packedFormat(from.sample), static_cast<int>(from.rate), 0, nullptr);
    resampler_.reset(context);
    reset();
}

void Converter::reset() {
    swr_close(resampler_.get());
    swr_init(resampler_.get());
}

void Converter::convert(const PcmBuffer& in, PcmBuffer& out) {
    run(reinterpret_cast<const std::uint8_t*>(in.bytes.data()), static_cast<int>(in.frames), out);
}

void Converter::drain(PcmBuffer& out) { run(nullptr, 0, out); }

void Converter::run(const std::uint8_t* data, int frames, PcmBuffer& out) {
    const int most = swr_get_out_samples(resampler_.get(), frames);
    if (most <= 0)
        return;
    const std::size_t size = out.bytes.size();
    out.bytes.resize(size + static_cast<std::size_t>(most) * to_.bytesPerFrame());
    auto* into = reinterpret_cast<std::uint8_t*>(out.bytes.data() + size);
    const int made = swr_convert(resampler_.get(), &into, most, data != nullptr ? &data : nullptr, frames);
    const std::size_t count = made > 0 ? static_cast<std::size_t>(made) : 0;
    out.bytes.resize(size + count * to_.bytesPerFrame());
    out.frames += count;
    if (to_.sample == SampleFormat::s24In32)
        moveDownTo24Bits(out.bytes.data() + size, count * to_.channels);
}

} // namespace tarn
