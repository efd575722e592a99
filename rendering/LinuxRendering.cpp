#include "rendering/LinuxRendering.h"

#include <algorithm>
#include <cassert>
#include <cmath>

#include "mediaprotocol/MediaError.h"
#include "player/MediaTimes.h"
#include "rendering/RemoteRendering.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

constexpr std::size_t pieceFrames = 4096;

RenderingFactory::Outcome openNow(const std::shared_ptr<LinuxMediaAsset>& asset,
                                  const DecoderModule& module) {
    auto reader = std::make_unique<FileReader>(asset->file());
    DecoderModule::Opened opened = module.open(*reader, asset->info());
    if (!opened.decoder)
        return {nullptr, std::move(opened.error)};
    return {std::make_unique<LinuxRendering>(asset, module, std::move(reader), std::move(opened.decoder)),
            std::nullopt};
}

} // namespace

LinuxRendering::LinuxRendering(std::shared_ptr<LinuxMediaAsset> asset, const DecoderModule& module,
                               std::unique_ptr<FileReader> reader, std::unique_ptr<Decoder> decoder)
    : asset_(std::move(asset)), module_(module), reader_(std::move(reader)), decoder_(std::move(decoder)) {}

void LinuxRendering::seek(nanoseconds position, float rate, const PcmFormat& format) {
    assert(rate != 0);
    if (!forward_ || format != format_) {
        backward_.reset();
        forward_.emplace(*decoder_, module_, asset_->info(), format);
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

nanoseconds LinuxRendering::timeOf(double frame) const {
    const double latest = forward_->length() ? static_cast<double>(*forward_->length()) : frame;
    return nanoseconds(std::llround(std::clamp(frame, 0.0, latest) * 1e9 / format_.rate));
}

nanoseconds LinuxRendering::endTime() const {
    if (speed_ < 0)
        return 0ns;
    const auto& info = asset_->info();
    if (!info.frames)
        return timeOf(start_ + static_cast<double>(rendered_) * speed_);
    return nanoseconds(std::llround(static_cast<double>(*info.frames) * 1e9 / info.format.rate));
}

RenderedSpan LinuxRendering::render(PcmBuffer& buffer, std::size_t maxFrames) {
    RenderedSpan span;
    span.start = timeOf(start_ + static_cast<double>(rendered_) * speed_);
    const std::size_t before = buffer.frames;
    if (stretcher_) {
        fillStretched(maxFrames);
        takeStretched(buffer, maxFrames);
    } else {
        state_ = source_->read(buffer, maxFrames);
    }
    span.frames = buffer.frames - before;
    rendered_ += static_cast<std::int64_t>(span.frames);
    span.end = timeOf(start_ + static_cast<double>(rendered_) * speed_);

    if (state_ == Decoder::State::more || taken_ < stretched_.frames)
        return span;
    if (state_ == Decoder::State::failed) {
        span.state = RenderedSpan::State::failed;
        span.error = source_->error();
    } else {
        span.state = RenderedSpan::State::ended;
        span.end = endTime();
    }
    return span;
}

// Has the stretcher make `frames` frames, or all that the file still gives.
void LinuxRendering::fillStretched(std::size_t frames) {
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

std::size_t LinuxRendering::takeStretched(PcmBuffer& buffer, std::size_t maxFrames) {
    const std::size_t count = std::min(maxFrames, stretched_.frames - taken_);
    const std::size_t size = format_.bytesPerFrame();
    buffer.append(stretched_.bytes.data() + taken_ * size, count, size);
    taken_ += count;
    return count;
}

RenderingFactory::Outcome LinuxRenderingFactory::open(const std::shared_ptr<MediaAsset>& asset,
                                                      std::function<void()> goesOn) {
    const auto file = std::dynamic_pointer_cast<LinuxMediaAsset>(asset);
    const DecoderModule* module = loader_.load();
    if (!file || module == nullptr)
        return {nullptr, mediaError(MediaErrorCode::noDecoder, "The audio decoder is not installed.")};
    if (!file->file()->remote)
        return openNow(file, *module);
    RemoteRendering::Options options;
    if (file->info().frames)
        options.length = nanosecondsOf(file->duration());
    auto remote = RemoteRendering::create(
        loop_, [file, module] { return openNow(file, *module); }, std::move(goesOn), options);
    if (!remote)
        return {nullptr, mediaError(MediaErrorCode::timedOut, "Too many files do not answer.")};
    return {std::move(remote), std::nullopt};
}

} // namespace tarn
