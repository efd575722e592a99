#include "pcm/Crossfade.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <type_traits>
#include <utility>

namespace tarn {

void Crossfade::begin(PcmBuffer old, const PcmFormat& format) {
    old_ = std::move(old);
    format_ = format;
    done_ = 0;
}

void Crossfade::apply(PcmBuffer& buffer) {
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
void Crossfade::mix(PcmBuffer& buffer, std::size_t frames) {
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
