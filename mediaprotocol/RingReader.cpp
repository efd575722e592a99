#include "mediaprotocol/RingReader.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace tarn {

namespace {

constexpr std::int64_t latest = std::int64_t{1} << 60; // nanoseconds: 36 years

bool isTime(std::int64_t time) { return time >= 0 && time <= latest; }

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

/// Makes the next span the current one. False when that is a lie.
bool RingReader::readSpan() {
    const RingHeader& header = memory_.header();
    const std::uint64_t spans = header.spansWritten.load(std::memory_order_seq_cst) - spans_;
    const std::uint64_t frames = header.framesWritten.load(std::memory_order_acquire) - frames_;
    if (spans > RingHeader::mostSpans || frames > memory_.capacity())
        return false;
    if (spans == 0)
        return true;
    MediaSpan span;
    std::memcpy(&span, &header.spans[spans_ % RingHeader::mostSpans], sizeof span); // once: it may change
    if (span.frames > frames || span.state > MediaSpan::State::failed || !isTime(span.start) ||
        !isTime(span.end) || (span.frames == 0 && span.state == MediaSpan::State::more))
        return false;
    current_ = span;
    return true;
}

RingReader::Taken RingReader::take(std::uint32_t generation, PcmBuffer& buffer, std::size_t maxFrames) {
    for (;;) {
        if (!current_ && !readSpan())
            return {Taken::What::lie, {}};
        if (!current_)
            return {Taken::What::nothing, {}};
        if (current_->generation == generation)
            break;
        if (static_cast<std::int32_t>(generation - current_->generation) < 0)
            return {Taken::What::lie, {}};
        release(current_->frames);
    }
    const auto frames = static_cast<std::uint32_t>(std::min<std::size_t>(maxFrames, current_->frames));
    const Taken taken{Taken::What::span, firstPart(*current_, frames)};
    copyFrames(buffer, frames);
    release(frames);
    return taken;
}

void RingReader::copyFrames(PcmBuffer& buffer, std::size_t frames) const {
    for (std::size_t copied = 0; copied < frames;) {
        const auto place = static_cast<std::size_t>((frames_ + copied) % memory_.capacity());
        const std::size_t count = std::min(frames - copied, memory_.capacity() - place);
        const std::byte* from = memory_.frame(frames_ + copied);
        buffer.bytes.insert(buffer.bytes.end(), from, from + count * memory_.frameSize());
        copied += count;
    }
    buffer.frames += frames;
}

/// The renderer may write over the first `frames` frames of the current span.
void RingReader::release(std::size_t frames) {
    const auto part = static_cast<std::uint32_t>(frames);
    frames_ += frames;
    if (part == current_->frames) {
        current_.reset();
        ++spans_;
    } else {
        current_->start = firstPart(*current_, part).end;
        current_->frames -= part;
    }
    RingHeader& header = memory_.header();
    header.framesTaken.store(frames_, std::memory_order_release);
    header.spansTaken.store(spans_, std::memory_order_release);
}

void RingReader::want(std::size_t frames) {
    memory_.header().wanted.store(frames, std::memory_order_seq_cst);
}

void RingReader::wantNothing() { memory_.header().wanted.store(0, std::memory_order_relaxed); }

bool RingReader::hasTaken(std::size_t frames) {
    if (frames_ - framesTold_ < frames)
        return false;
    framesTold_ = frames_;
    return true;
}

} // namespace tarn
