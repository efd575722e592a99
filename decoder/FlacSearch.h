#pragma once

#include <cstdint>
#include <optional>

#include "decoder/ByteSource.h"
#include "decoder/FlacFrame.h"

namespace tarn {

/// Finds frames in a FLAC file by their own numbers, in a few dozen reads however long it is. FFmpeg's search
/// gives up where frames are very small, and then reads all of the file.
class FlacSearch {
public:
    struct Place {
        std::int64_t offset = 0; ///< in the file
        FlacFrame frame;
    };

    /// The first frame stands at `firstFrame`.
    FlacSearch(ByteSource& source, std::int64_t firstFrame, std::int64_t blockSize);

    /// The last frame that begins at or before sample `target`, by the frames' own count.
    std::optional<Place> lastUntil(std::int64_t target) const;

    /// The last frame of the file.
    std::optional<Place> last() const;

private:
    std::optional<Place> at(std::string_view bytes, std::int64_t offset) const;
    std::optional<Place> firstIn(std::int64_t begin, std::int64_t end) const;
    std::optional<Place> lastIn(std::int64_t begin, std::int64_t end, std::int64_t target) const;

    ByteSource& source_;
    const std::int64_t firstFrame_;
    const std::int64_t blockSize_;
    unsigned constantBits_ = 0; // of the headers
};

} // namespace tarn
