#include "rendering/ForwardSource.h"

#include <algorithm>
#include <numeric>

namespace tarn {

namespace {

constexpr std::size_t chunkFrames = 4096;
constexpr std::int64_t filterFrames = 256; // more than a resampler looks back, in frames of the file

/// frames * to / from, which may be more than fits on the way, rounded as `half` says.
std::int64_t scaled(std::int64_t frames, std::int64_t to, std::int64_t from, std::int64_t half = 0) {
    return frames / from * to + (frames % from * to + half) / from;
}

} // namespace

ForwardSource::ForwardSource(Decoder& decoder, const AudioFileInfo& info, const PcmFormat& format)
    : decoder_(decoder),
      from_(info.format),
      to_(format),
      converter_(info.format == format ? nullptr : std::make_unique<Converter>(info.format, format)) {
    if (info.frames)
        length_ = scaled(*info.frames, to_.rate, from_.rate, from_.rate / 2);
}

// A resampler's output falls on the same places only if it begins at a frame that both rates share.
void ForwardSource::seek(std::int64_t position) {
    position_ = position;
    state_ = Decoder::State::more;
    if (!converter_) {
        decoder_.seek(position);
        return;
    }
    converter_->reset();
    converted_.clear();
    taken_ = 0;
    if (from_.rate == to_.rate) {
        excess_ = 0;
        decoder_.seek(position);
        return;
    }
    const std::int64_t divisor = std::gcd(from_.rate, to_.rate);
    const std::int64_t blockIn = from_.rate / divisor;
    const std::int64_t blockOut = to_.rate / divisor;
    const std::int64_t target = scaled(position, blockIn, blockOut) - filterFrames;
    const std::int64_t block = std::max<std::int64_t>(0, target / blockIn);
    excess_ = static_cast<std::size_t>(position - block * blockOut);
    decoder_.seek(block * blockIn);
}

Decoder::State ForwardSource::read(PcmBuffer& buffer, std::size_t maxFrames) {
    if (converter_)
        return readConverted(buffer, maxFrames);
    const std::size_t limit = buffer.frames + maxFrames;
    Decoder::State state = Decoder::State::more;
    while (state == Decoder::State::more && buffer.frames < limit)
        state = decoder_.read(buffer, limit - buffer.frames);
    return state;
}

Decoder::State ForwardSource::readConverted(PcmBuffer& buffer, std::size_t maxFrames) {
    while (maxFrames > 0) {
        const std::size_t held = converted_.frames - taken_;
        if (held > 0) {
            const std::size_t count = std::min(held, maxFrames);
            moveOut(buffer, count);
            maxFrames -= count;
        } else if (state_ != Decoder::State::more) {
            return state_;
        } else {
            convertMore();
        }
    }
    return Decoder::State::more;
}

void ForwardSource::convertMore() {
    decoded_.clear();
    converted_.clear();
    taken_ = 0;
    state_ = decoder_.read(decoded_, chunkFrames);
    converter_->convert(decoded_, converted_);
    if (state_ == Decoder::State::ended)
        converter_->drain(converted_);
    const std::size_t dropped = std::min(excess_, converted_.frames);
    taken_ = dropped;
    excess_ -= dropped;
    if (length_ && state_ == Decoder::State::ended) {
        const std::int64_t left = std::max<std::int64_t>(0, *length_ - position_);
        converted_.frames = std::min(converted_.frames, taken_ + static_cast<std::size_t>(left));
    }
}

void ForwardSource::moveOut(PcmBuffer& buffer, std::size_t frames) {
    const std::size_t size = to_.bytesPerFrame();
    buffer.append(converted_.bytes.data() + taken_ * size, frames, size);
    taken_ += frames;
    position_ += static_cast<std::int64_t>(frames);
}

} // namespace tarn
