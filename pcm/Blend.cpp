#include "pcm/Blend.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <type_traits>

namespace tarn {

void FrameMemory::reset(const PcmFormat& format, std::size_t capacity) {
    frameSize_ = format.bytesPerFrame();
    capacity_ = capacity;
    bytes_.assign(capacity * frameSize_, std::byte{0});
}

void FrameMemory::put(std::int64_t index, const PcmBuffer& buffer) {
    const std::byte* from = buffer.bytes.data();
    for (std::size_t left = buffer.frames; left > 0;) {
        const std::size_t place = placeOf(index);
        const std::size_t count = std::min(left, capacity_ - place);
        std::copy_n(from, count * frameSize_, bytes_.data() + place * frameSize_);
        from += count * frameSize_;
        index += static_cast<std::int64_t>(count);
        left -= count;
    }
}

PcmBuffer FrameMemory::get(std::int64_t index, std::size_t frames) const {
    PcmBuffer buffer;
    while (buffer.frames < frames) {
        const std::size_t place = placeOf(index + static_cast<std::int64_t>(buffer.frames));
        const std::size_t count = std::min(frames - buffer.frames, capacity_ - place);
        buffer.append(bytes_.data() + place * frameSize_, count, frameSize_);
    }
    return buffer;
}

void Blend::begin(PcmBuffer old, const PcmFormat& format) {
    old_ = std::move(old);
    format_ = format;
    done_ = 0;
}

void Blend::apply(PcmBuffer& buffer) {
    const std::size_t frames = std::min(buffer.frames, old_.frames - done_);
    if (format_.sample == SampleFormat::s16)
        mix<std::int16_t>(buffer, frames);
    else if (format_.sample == SampleFormat::f32)
        mix<float>(buffer, frames);
    else
        mix<std::int32_t>(buffer, frames);
    done_ += frames;
}

template <class Sample>
void Blend::mix(PcmBuffer& buffer, std::size_t frames) {
    const std::size_t channels = format_.channels;
    const auto* old = reinterpret_cast<const Sample*>(old_.bytes.data()) + done_ * channels;
    auto* samples = reinterpret_cast<Sample*>(buffer.bytes.data());
    for (std::size_t frame = 0; frame < frames; ++frame) {
        const double share = static_cast<double>(done_ + frame + 1) / static_cast<double>(old_.frames + 1);
        for (std::size_t i = frame * channels; i < (frame + 1) * channels; ++i) {
            const double value =
                static_cast<double>(old[i]) * (1 - share) + static_cast<double>(samples[i]) * share;
            if constexpr (std::is_integral_v<Sample>)
                samples[i] = static_cast<Sample>(std::lround(value));
            else
                samples[i] = static_cast<Sample>(value);
        }
    }
}

} // namespace tarn
