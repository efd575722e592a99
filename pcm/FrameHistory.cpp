#include "pcm/FrameHistory.h"

#include <algorithm>

namespace tarn {

void FrameHistory::reset(const PcmFormat& format, std::size_t capacity) {
    frameSize_ = format.bytesPerFrame();
    capacity_ = capacity;
    bytes_.assign(capacity * frameSize_, std::byte{0});
}

void FrameHistory::put(std::int64_t index, const PcmBuffer& buffer) {
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

PcmBuffer FrameHistory::get(std::int64_t index, std::size_t frames) const {
    PcmBuffer buffer;
    while (buffer.frames < frames) {
        const std::size_t place = placeOf(index + static_cast<std::int64_t>(buffer.frames));
        const std::size_t count = std::min(frames - buffer.frames, capacity_ - place);
        buffer.append(bytes_.data() + place * frameSize_, count, frameSize_);
    }
    return buffer;
}

} // namespace tarn
