#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace tarn {

/// The header of one frame of MPEG audio (layers I to III) or of AAC in ADTS.
///
/// Files of such frames need no other header: where one frame begins is known from the one before it. A
/// header alone is four bytes that may turn up anywhere; several in a row that fit are believed.
struct MpegFrame {
    enum class Kind : std::uint8_t { layer1, layer2, layer3, adts };

    Kind kind = Kind::layer3;
    std::size_t bytes = 0; ///< to the next frame
    int samples = 0;       ///< for each channel
    int rate = 0;

    /// What `bytes` begin with; none when that is no frame, or one without a length.
    static std::optional<MpegFrame> parse(std::string_view bytes);

    /// Could this be a frame of the same stream?
    bool matches(const MpegFrame& other) const { return kind == other.kind && rate == other.rate; }
};

/// Frames of one stream, one behind the other.
struct MpegFrameRun {
    int frames = 0;
    std::size_t bytes = 0;
    std::int64_t samples = 0;
};

/// The frames that `bytes` begin with, as far as their headers can be read.
MpegFrameRun readMpegFrames(std::string_view bytes);

} // namespace tarn
