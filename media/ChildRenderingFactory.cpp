#include "media/ChildRenderingFactory.h"

#include <utility>

#include "mediaprotocol/MediaError.h"
#include "player/MediaTimes.h"

namespace tarn {

RenderingFactory::Outcome ChildRenderingFactory::open(const std::shared_ptr<MediaAsset>& asset,
                                                      std::function<void()> goesOn) {
    const auto file = std::dynamic_pointer_cast<LinuxMediaAsset>(asset);
    auto begun = begin(file);
    if (auto* error = std::get_if<Error>(&begun))
        return {nullptr, std::move(*error)};
    std::optional<std::chrono::nanoseconds> length;
    if (file->info().frames)
        length = nanosecondsOf(file->duration());
    auto another = [this, file]() -> std::optional<ChildRendering::Renderer> {
        auto again = begin(file);
        auto* renderer = std::get_if<ChildRendering::Renderer>(&again);
        return renderer != nullptr ? std::optional(std::move(*renderer)) : std::nullopt;
    };
    return {std::make_unique<ChildRendering>(loop_, process_,
                                             std::get<ChildRendering::Renderer>(std::move(begun)), length,
                                             std::move(goesOn), std::move(another)),
            std::nullopt};
}

std::variant<ChildRendering::Renderer, Error>
ChildRenderingFactory::begin(const std::shared_ptr<LinuxMediaAsset>& asset) {
    auto ring = RingMemory::create();
    auto child = asset && ring ? process_.fork(ChildKind::renderer, &*ring) : std::nullopt;
    if (!child)
        return mediaError(MediaErrorCode::noDecoder, "The audio decoder is not there.");
    const FilePorter::Loan loan = porter_.lend(asset->file());
    const OpenItem request{.form = loan.form, .info = InfoRecord::of(asset->info())};
    const auto sent = loan.form == FileForm::none
                          ? Channel::Result::broken
                          : child->channel().send(request, std::span(&loan.descriptor, 1));
    if (sent != Channel::Result::done && !child->endedWithItsParent(std::chrono::milliseconds(0)))
        return mediaError(MediaErrorCode::cannotOpen, "The file could not be opened.");
    return ChildRendering::Renderer{*std::move(child), RingReader(std::move(*ring))};
}

} // namespace tarn
