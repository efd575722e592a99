#include "mediaprotocol/RingWriter.h"

#include <algorithm>
#include <cassert>
#include <cstring>

namespace tarn {

bool RingWriter::begin(const PcmFormat& format, std::uint64_t capacity) {
    frameSize_ = format.bytesPerFrame();
    if (capacity == 0 || capacity > RingMemory::size / frameSize_)
        return false;
    capacity_ = static_cast<std::size_t>(capacity) * frameSize_;
    begin_ = bytes_;
    complete_ = false;
    return true;
}

std::uint64_t RingWriter::heldBytes() const {
    return bytes_ - std::max(begin_, memory_.header().bytesTaken.load(std::memory_order_acquire));
}

std::size_t RingWriter::room() const {
    if (spans_ - memory_.header().spansTaken.load(std::memory_order_acquire) >= RingHeader::mostSpans)
        return 0;
    const std::uint64_t held = heldBytes();
    return held < capacity_ ? (capacity_ - static_cast<std::size_t>(held)) / frameSize_ : 0;
}

void RingWriter::put(const PcmBuffer& buffer, MediaSpan span) {
    const std::size_t size = buffer.frames * frameSize_;
    assert(buffer.frames <= room() && buffer.bytes.size() >= size);
    for (std::size_t copied = 0; copied < size;) {
        const auto place = static_cast<std::size_t>((bytes_ + copied) % capacity_);
        const std::size_t count = std::min(size - copied, capacity_ - place);
        std::memcpy(memory_.bytes() + place, buffer.bytes.data() + copied, count);
        copied += count;
    }
    RingHeader& header = memory_.header();
    span.frames = static_cast<std::uint32_t>(buffer.frames);
    span.bytes = static_cast<std::uint32_t>(size);
    header.spans[spans_ % RingHeader::mostSpans] = span;
    bytes_ += size;
    ++spans_;
    complete_ = span.state != MediaSpan::State::more;
    header.bytesWritten.store(bytes_, std::memory_order_release);
    header.spansWritten.store(spans_, std::memory_order_seq_cst);
}

// The service says that it waits and then looks once more; here is written first and looked second. So one of
// the two sees the other.
bool RingWriter::owesWord() const {
    RingHeader& header = memory_.header();
    const std::uint64_t wanted = header.wanted.load(std::memory_order_seq_cst);
    if (wanted == 0 || (heldBytes() < wanted && !complete_ && room() > 0))
        return false;
    return header.wanted.exchange(0) != 0;
}

} // namespace tarn
