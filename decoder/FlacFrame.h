#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace tarn {

/// The header of a FLAC frame, which tells where in the recording it stands: so a frame's place is exact in
/// every container, and is known after a jump to anywhere in the file.
struct FlacFrame {
    std::int64_t first = 0; ///< its first sample
    std::int64_t samples = 0;

    /// What `bytes` begin with. `blockSize` is the largest of the stream: a frame may carry only its own
    /// number among frames of that size. None when no header of a valid check sum stands there.
    static std::optional<FlacFrame> parse(std::string_view bytes, std::int64_t blockSize);
};

/// The largest block size and the length that a FLAC stream's first block of metadata tells.
struct FlacStreamInfo {
    std::int64_t blockSize = 0;
    std::int64_t samples = 0; ///< 0 when its writer did not know

    static std::optional<FlacStreamInfo> parse(std::string_view block);
};

} // namespace tarn
