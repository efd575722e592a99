#pragma once

#include "media/DecoderLoader.h"
#include "media/FileReader.h"
#include "media/LinuxMediaAsset.h"
#include "player/EventLoop.h"
#include "player/Rendering.h"
#include "rendering/BackwardSource.h"
#include "rendering/ForwardSource.h"
#include "rendering/Stretcher.h"

namespace tarn {

/// One file as output frames: decoded, converted, turned around for negative rates, stretched for rates other
/// than 1. At rate 1 and the file's own format nothing touches the samples.
class LinuxRendering final : public Rendering {
public:
    /// `decoder` reads from `reader`, `reader` from the asset's file.
    LinuxRendering(std::shared_ptr<LinuxMediaAsset> asset, const DecoderModule& module,
                   std::unique_ptr<FileReader> reader, std::unique_ptr<Decoder> decoder);

    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) override;
    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override;

private:
    void fillStretched(std::size_t frames);
    std::size_t takeStretched(PcmBuffer& buffer, std::size_t maxFrames);
    std::chrono::nanoseconds timeOf(double frame) const;
    std::chrono::nanoseconds endTime() const;

    const std::shared_ptr<LinuxMediaAsset> asset_;
    const DecoderModule& module_;
    const std::unique_ptr<FileReader> reader_;
    const std::unique_ptr<Decoder> decoder_;

    PcmFormat format_;
    std::optional<ForwardSource> forward_;
    std::optional<BackwardSource> backward_;
    FrameSource* source_ = nullptr; // the one of the two that is in use
    std::optional<Stretcher> stretcher_;

    double speed_ = 1;          // frames of media per frame of output; below 0 backwards
    double start_ = 0;          // frame of media at which the last seek() went on
    std::int64_t rendered_ = 0; // frames of output since then
    Decoder::State state_ = Decoder::State::more;
    PcmBuffer piece_;
    PcmBuffer stretched_;
    std::size_t taken_ = 0; // of stretched_, in frames
};

/// Opens files for rendering with the decoder module. The player thread itself reads local files; what
/// another machine or process has to deliver is rendered on a thread of its own.
class LinuxRenderingFactory final : public RenderingFactory {
public:
    /// Both outlive the factory and its renderings.
    LinuxRenderingFactory(EventLoop& loop, DecoderLoader& loader) : loop_(loop), loader_(loader) {}

    Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) override;

private:
    EventLoop& loop_;
    DecoderLoader& loader_;
};

} // namespace tarn
