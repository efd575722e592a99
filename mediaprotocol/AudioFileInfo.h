#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "pcm/PcmFormat.h"

namespace tarn {

/// What an audio file says about itself.
struct AudioFileInfo {
    /// How the decoder hands its frames out; 16-bit samples stay s16, wider integers are s32 (high bits
    /// used), the rest is f32.
    PcmFormat format;

    /// Where the audible part begins and how long it is, in frames of the decoder's raw output: what encoders
    /// put before and behind it is left out. The length is exact; none when the file does not tell.
    std::int64_t firstFrame = 0;
    std::optional<std::int64_t> frames;

    /// Without `frames`: about how many there are, to be shown and for nothing else. To know it exactly all
    /// of the file has to be read (LengthMeasurement).
    std::optional<std::int64_t> estimatedFrames;

    // Valid UTF-8 without control characters, cut to a sane length.
    std::optional<std::string> title;
    std::optional<std::string> album;
    std::optional<std::string> artist;
};

} // namespace tarn
