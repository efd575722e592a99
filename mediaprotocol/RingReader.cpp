#include "mediaprotocol/RingReader.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace tarn {

namespace {

/// The first `frames` frames of a span.
MediaSpan firstPart(const MediaSpan& span, std::uint32_t frames) {
    MediaSpan part = span;
    part.frames = frames;
    if (frames < span.frames) {
        const double share = static_cast<double>(frames) / static_cast<double>(span.frames);
        part.end = span.start + std::llround(share * static_cast<double>(span.end - span.start));
        part.state = MediaSpan::State::more;
    }
    return part;
}

} // namespace

void RingReader::begin(std::uint32_t generation, const PcmFormat& format) {
    generation_ = generation;
    frameSize_ = format.bytesPerFrame();
    capacity_ = RingMemory::capacityFor(format) * frameSize_;
    bytesTold_ = bytes_;
    if (current_) {
        bytes_ += current_->bytes;
        ++spans_;
        current_.reset();
    }
    wantNothing();
}

/// Makes the next span of this generation the current one.
RingReader::Next RingReader::readSpan() {
    const RingHeader& header = memory_.header();
    for (;;) {
        const std::uint64_t spans = header.spansWritten.load(std::memory_order_seq_cst) - spans_;
        const std::uint64_t bytes = header.bytesWritten.load(std::memory_order_acquire) - bytes_;
        if (spans > RingHeader::mostSpans || bytes > 2 * RingMemory::size) // of the old format and the new
            return Next::lie;
        if (spans == 0)
            return Next::nothing;
        MediaSpan span;
        std::memcpy(&span, &header.spans[spans_ % RingHeader::mostSpans], sizeof span); // once: it may change
        const auto age = static_cast<std::int32_t>(generation_ - span.generation);
        if (age < 0 || span.bytes > bytes)
            return Next::lie;
        if (age > 0) {
            bytes_ += span.bytes;
            ++spans_;
            continue;
        }
        if (span.bytes > capacity_ || span.bytes != span.frames * frameSize_ ||
            span.state > MediaSpan::State::failed || !MediaSpan::isTime(span.start) ||
            !MediaSpan::isTime(span.end) || (span.frames == 0 && span.state == MediaSpan::State::more))
            return Next::lie;
        current_ = span;
        return Next::span;
    }
}

RingReader::Taken RingReader::take(PcmBuffer& buffer, std::size_t maxFrames) {
    if (!current_) {
        const Next next = readSpan();
        if (next != Next::span) {
            release(0);
            return {next == Next::lie ? Taken::What::lie : Taken::What::nothing, {}};
        }
    }
    const auto frames = static_cast<std::uint32_t>(std::min<std::size_t>(maxFrames, current_->frames));
    const Taken taken{Taken::What::span, firstPart(*current_, frames)};
    copy(buffer, frames);
    release(frames);
    return taken;
}

void RingReader::copy(PcmBuffer& buffer, std::size_t frames) const {
    const std::size_t size = frames * frameSize_;
    for (std::size_t copied = 0; copied < size;) {
        const auto place = static_cast<std::size_t>((bytes_ + copied) % capacity_);
        const std::size_t count = std::min(size - copied, capacity_ - place);
        const std::byte* from = memory_.bytes() + place;
        buffer.bytes.insert(buffer.bytes.end(), from, from + count);
        copied += count;
    }
    buffer.frames += frames;
}

/// The renderer may write over the first `frames` frames of the current span, and over all before it.
void RingReader::release(std::uint32_t frames) {
    if (current_) {
        const MediaSpan part = firstPart(*current_, frames);
        bytes_ += frames * frameSize_;
        current_->start = part.end;
        current_->frames -= frames;
        current_->bytes -= static_cast<std::uint32_t>(frames * frameSize_);
        if (current_->frames == 0) {
            current_.reset();
            ++spans_;
        }
    }
    RingHeader& header = memory_.header();
    header.bytesTaken.store(bytes_, std::memory_order_release);
    header.spansTaken.store(spans_, std::memory_order_release);
}

void RingReader::want(std::size_t frames) {
    const std::size_t most = capacity_ / 2;
    memory_.header().wanted.store(std::min(frames * frameSize_, most), std::memory_order_seq_cst);
}

void RingReader::wantNothing() { memory_.header().wanted.store(0, std::memory_order_relaxed); }

bool RingReader::hasTakenHalf() {
    if (bytes_ - bytesTold_ < capacity_ / 2)
        return false;
    bytesTold_ = bytes_;
    return true;
}

} // namespace tarn
