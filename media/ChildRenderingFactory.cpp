#include "media/ChildRenderingFactory.h"

#include <utility>

#include "media/ChildRendering.h"
#include "media/LinuxMediaAsset.h"
#include "mediaprotocol/MediaError.h"
#include "player/MediaTimes.h"

namespace tarn {

RenderingFactory::Outcome ChildRenderingFactory::open(const std::shared_ptr<MediaAsset>& asset,
                                                      std::function<void()> goesOn) {
    const auto file = std::dynamic_pointer_cast<LinuxMediaAsset>(asset);
    auto ring = RingMemory::create();
    auto child = file && ring ? process_.fork(ChildKind::renderer, &*ring) : std::nullopt;
    if (!child)
        return {nullptr, mediaError(MediaErrorCode::noDecoder, "The audio decoder is not there.")};
    const FilePorter::Loan loan = porter_.lend(file->file());
    const OpenItem request{.form = loan.form, .info = InfoRecord::of(file->info())};
    if (loan.form == FileForm::none ||
        child->channel().send(request, std::span(&loan.descriptor, 1)) != Channel::Result::done)
        return {nullptr, mediaError(MediaErrorCode::cannotOpen, "The file could not be opened.")};
    std::optional<std::chrono::nanoseconds> length;
    if (file->info().frames)
        length = nanosecondsOf(file->duration());
    return {std::make_unique<ChildRendering>(loop_, process_, *std::move(child), RingReader(std::move(*ring)),
                                             length, std::move(goesOn)),
            std::nullopt};
}

} // namespace tarn
