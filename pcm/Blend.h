#pragma once

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// The frames that were written last, by their index, as far back as its capacity.
class FrameMemory {
public:
    void reset(const PcmFormat& format, std::size_t capacity);

    /// `buffer` begins at frame `index`.
    void put(std::int64_t index, const PcmBuffer& buffer);

    /// `frames` frames from `index` on, which are all remembered.
    PcmBuffer get(std::int64_t index, std::size_t frames) const;

private:
    std::size_t placeOf(std::int64_t index) const { return static_cast<std::size_t>(index) % capacity_; }

    std::size_t frameSize_ = 0;
    std::size_t capacity_ = 0;
    std::vector<std::byte> bytes_;
};

/// Lets what was taken back fade into what replaces it.
class Blend {
public:
    void reset() { old_.clear(); }

    /// `old` is what would have been heard.
    void begin(PcmBuffer old, const PcmFormat& format);

    /// Mixes the frames that `buffer` begins with, as far as the blend goes on.
    void apply(PcmBuffer& buffer);

    bool pending() const { return done_ < old_.frames; }

private:
    template <class Sample>
    void mix(PcmBuffer& buffer, std::size_t frames);

    PcmFormat format_;
    PcmBuffer old_;
    std::size_t done_ = 0;
};

} // namespace tarn
