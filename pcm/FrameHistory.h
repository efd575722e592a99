#pragma once

#include <cstdint>

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// A ring that remembers the frames that were written last, by their index.
class FrameHistory {
public:
    /// Forgets everything; from now on the last `capacity` frames of `format` are remembered.
    void reset(const PcmFormat& format, std::size_t capacity);

    /// `buffer` begins at frame `index`.
    void put(std::int64_t index, const PcmBuffer& buffer);

    /// `frames` frames from `index` on, which are all remembered.
    PcmBuffer get(std::int64_t index, std::size_t frames) const;

private:
    std::size_t placeOf(std::int64_t index) const {
        return static_cast<std::size_t>(index % static_cast<std::int64_t>(capacity_));
    }

    std::size_t frameSize_ = 0;
    std::size_t capacity_ = 0;
    std::vector<std::byte> bytes_;
};

} // namespace tarn
