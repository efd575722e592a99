#include "sound/StreamWriter.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace tarn {

namespace {

constexpr std::int64_t fadesPerSecond = 200; // a crossfade takes five milliseconds

} // namespace

void StreamWriter::attach(SoundStream& stream, std::int64_t index, std::size_t capacity) {
    stream_ = &stream;
    format_ = stream.format();
    history_.reset(format_, capacity);
    crossfade_.reset();
    base_ = index;
    filledTo_ = index;
    jumps_ = false;
    unplaced_ = false;
}

void StreamWriter::write(std::int64_t index, const PcmBuffer& buffer) {
    if (!crossfade_.pending())
        return send(index, buffer);
    PcmBuffer mixed = buffer;
    crossfade_.apply(mixed);
    send(index, mixed);
}

void StreamWriter::send(std::int64_t index, const PcmBuffer& buffer) {
    history_.put(index, buffer);
    if (std::exchange(jumps_, false))
        stream_->writeAt(index - base_, buffer.bytes.data(), buffer.frames);
    else
        stream_->write(buffer.bytes.data(), buffer.frames);
    filledTo_ = std::max(filledTo_, index + static_cast<std::int64_t>(buffer.frames));
}

void StreamWriter::writeLate(std::int64_t index, const PcmBuffer& buffer, std::size_t margin) {
    if (empty()) // the stream has not begun to run
        return write(index, buffer);
    crossfade_.reset(); // there is nothing to fade out of
    history_.put(index, buffer);
    stream_->writeSoon(margin, buffer.bytes.data(), buffer.frames);
    jumps_ = false;
    filledTo_ = index + static_cast<std::int64_t>(buffer.frames);
    unplaced_ = true;
}

void StreamWriter::takeBack(std::int64_t index, std::int64_t end, Output::Join join) {
    if (join == Output::Join::blended) {
        const std::int64_t frames = std::min(end - index, format_.rate / fadesPerSecond);
        crossfade_.begin(history_.get(index, static_cast<std::size_t>(frames)), format_);
    } else {
        crossfade_.reset();
    }
    // Silence in their place: what comes next may be shorter, or late.
    const auto frames = static_cast<std::size_t>(filledTo_ - index);
    const std::vector<std::byte> silence(frames * format_.bytesPerFrame());
    stream_->writeAt(index - base_, silence.data(), frames);
    jumps_ = true;
}

void StreamWriter::writeAgain(std::int64_t index, std::int64_t end) {
    const PcmBuffer again = history_.get(index, static_cast<std::size_t>(end - index));
    stream_->writeAt(index - base_, again.bytes.data(), again.frames);
}

void StreamWriter::place(const SoundStream::Timing& timing, std::int64_t index) {
    if (std::exchange(unplaced_, false))
        base_ = index - timing.writeIndex;
}

} // namespace tarn
