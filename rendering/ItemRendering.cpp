#include "rendering/ItemRendering.h"

#include <algorithm>
#include <cassert>
#include <cmath>
#include <utility>

namespace tarn {

namespace {

constexpr std::size_t pieceFrames = 4096;

}

ItemRendering::ItemRendering(Decoder& decoder, AudioFileInfo info)
    : decoder_(decoder), info_(std::move(info)) {}

void ItemRendering::seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) {
    assert(rate != 0);
    if (!forward_ || format != format_) {
        backward_.reset();
        forward_.emplace(decoder_, info_, format);
        backward_.emplace(*forward_, format);
        format_ = format;
    }
    const double magnitude =
        std::clamp(std::fabs(static_cast<double>(rate)), Stretcher::slowest, Stretcher::fastest);
    speed_ = rate > 0 ? magnitude : -magnitude;
    stretcher_.reset();
    if (magnitude != 1)
        stretcher_.emplace(format, magnitude);

    std::int64_t frame = std::llround(std::chrono::duration<double>(position).count() * format.rate);
    if (forward_->length())
        frame = std::min(frame, *forward_->length());
    frame = std::max<std::int64_t>(0, frame);
    start_ = static_cast<double>(frame);
    rendered_ = 0;
    state_ = Decoder::State::more;
    stretched_.clear();
    taken_ = 0;
    source_ = rate > 0 ? static_cast<FrameSource*>(&*forward_) : &*backward_;
    source_->seek(frame);
}

std::int64_t ItemRendering::timeOf(double frame) const {
    const double latest = forward_->length() ? static_cast<double>(*forward_->length()) : frame;
    return std::llround(std::clamp(frame, 0.0, latest) * 1e9 / format_.rate);
}

std::int64_t ItemRendering::endTime() const {
    if (speed_ < 0)
        return 0;
    if (!info_.frames)
        return timeOf(start_ + static_cast<double>(rendered_) * speed_);
    return std::llround(static_cast<double>(*info_.frames) * 1e9 / info_.format.rate);
}

MediaSpan ItemRendering::render(PcmBuffer& buffer, std::size_t maxFrames) {
    MediaSpan span;
    span.start = timeOf(start_ + static_cast<double>(rendered_) * speed_);
    const std::size_t before = buffer.frames;
    if (stretcher_) {
        fillStretched(maxFrames);
        takeStretched(buffer, maxFrames);
    } else {
        state_ = source_->read(buffer, maxFrames);
    }
    span.frames = static_cast<std::uint32_t>(buffer.frames - before);
    rendered_ += span.frames;
    span.end = timeOf(start_ + static_cast<double>(rendered_) * speed_);

    if (state_ == Decoder::State::more || taken_ < stretched_.frames)
        return span;
    if (state_ == Decoder::State::failed) {
        span.state = MediaSpan::State::failed;
    } else {
        span.state = MediaSpan::State::ended;
        span.end = endTime();
    }
    return span;
}

// Has the stretcher make `frames` frames, or all that the file still gives.
void ItemRendering::fillStretched(std::size_t frames) {
    if (taken_ == stretched_.frames) {
        stretched_.clear();
        taken_ = 0;
    }
    while (state_ == Decoder::State::more && stretched_.frames - taken_ < frames) {
        piece_.clear();
        state_ = source_->read(piece_, pieceFrames);
        stretcher_->stretch(piece_, stretched_);
        if (state_ == Decoder::State::more)
            continue;
        stretcher_->drain(stretched_);
        if (state_ == Decoder::State::failed || !forward_->length())
            continue;
        // What is over of the item is known to the frame; the stretcher rounds to its periods.
        const double media = speed_ > 0 ? static_cast<double>(*forward_->length()) - start_ : start_;
        const auto total = static_cast<std::int64_t>(media / std::fabs(speed_));
        const auto left = static_cast<std::size_t>(std::max<std::int64_t>(0, total - rendered_));
        stretched_.frames = std::min(stretched_.frames, taken_ + left);
    }
}

void ItemRendering::takeStretched(PcmBuffer& buffer, std::size_t maxFrames) {
    const std::size_t count = std::min(maxFrames, stretched_.frames - taken_);
    const std::size_t size = format_.bytesPerFrame();
    buffer.append(stretched_.bytes.data() + taken_ * size, count, size);
    taken_ += count;
}

} // namespace tarn
