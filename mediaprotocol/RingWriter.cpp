#include "mediaprotocol/RingWriter.h"

#include <algorithm>
#include <cassert>
#include <cstring>

namespace tarn {

std::size_t RingWriter::room() const {
    const RingHeader& header = memory_.header();
    if (spans_ - header.spansTaken.load(std::memory_order_acquire) >= RingHeader::mostSpans)
        return 0;
    const std::uint64_t held = frames_ - header.framesTaken.load(std::memory_order_acquire);
    return held < memory_.capacity() ? memory_.capacity() - static_cast<std::size_t>(held) : 0;
}

void RingWriter::put(const PcmBuffer& buffer, MediaSpan span) {
    assert(buffer.frames <= room() && buffer.bytes.size() >= buffer.frames * memory_.frameSize());
    for (std::size_t copied = 0; copied < buffer.frames;) {
        const auto place = static_cast<std::size_t>((frames_ + copied) % memory_.capacity());
        const std::size_t count = std::min(buffer.frames - copied, memory_.capacity() - place);
        std::memcpy(memory_.frame(frames_ + copied), buffer.bytes.data() + copied * memory_.frameSize(),
                    count * memory_.frameSize());
        copied += count;
    }
    RingHeader& header = memory_.header();
    span.frames = static_cast<std::uint32_t>(buffer.frames);
    header.spans[spans_ % RingHeader::mostSpans] = span;
    frames_ += buffer.frames;
    ++spans_;
    complete_ = span.state != MediaSpan::State::more;
    header.framesWritten.store(frames_, std::memory_order_release);
    header.spansWritten.store(spans_, std::memory_order_seq_cst);
}

// The service says that it waits and then looks once more; here is written first and looked second. So one of
// the two sees the other.
bool RingWriter::owesWord() const {
    RingHeader& header = memory_.header();
    const std::uint64_t wanted = header.wanted.load(std::memory_order_seq_cst);
    if (wanted == 0)
        return false;
    const std::uint64_t held = frames_ - header.framesTaken.load(std::memory_order_acquire);
    if (held < wanted && !complete_ && room() > 0)
        return false;
    return header.wanted.exchange(0) != 0;
}

} // namespace tarn
