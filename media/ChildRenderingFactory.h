#pragma once

#include <variant>

#include "media/ChildRendering.h"
#include "media/FilePorter.h"
#include "media/LinuxMediaAsset.h"

namespace tarn {

/// Has items rendered by processes of their own. Player thread.
class ChildRenderingFactory final : public RenderingFactory {
public:
    /// All outlive the factory and its renderings.
    ChildRenderingFactory(EventLoopThread& loop, MediaProcess& process, FilePorter& porter)
        : loop_(loop), process_(process), porter_(porter) {}

    Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) override;

private:
    /// A renderer that was asked to open the file of `asset`.
    std::variant<ChildRendering::Renderer, Error> begin(const std::shared_ptr<LinuxMediaAsset>& asset);

    EventLoopThread& loop_;
    MediaProcess& process_;
    FilePorter& porter_;
};

} // namespace tarn
