#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn {

/// How a sample is held: native-endian, interleaved. s24In32 holds its value in the low 24 bits,
/// sign-extended.
enum class SampleFormat : std::uint8_t { s16, s24In32, s32, f32 };

/// The format of a stream of frames.
struct PcmFormat {
    SampleFormat sample = SampleFormat::s16;
    std::uint32_t rate = 44100;
    std::uint32_t channels = 2;

    std::size_t bytesPerFrame() const {
        return std::size_t{channels} * (sample == SampleFormat::s16 ? 2U : 4U);
    }
    bool operator==(const PcmFormat&) const = default;
};

} // namespace tarn
