#pragma once

#include "media/FilePorter.h"
#include "player/EventLoopThread.h"
#include "player/Rendering.h"

namespace tarn {

/// Has items rendered by processes of their own. Player thread.
class ChildRenderingFactory final : public RenderingFactory {
public:
    /// All outlive the factory and its renderings.
    ChildRenderingFactory(EventLoopThread& loop, MediaProcess& process, FilePorter& porter)
        : loop_(loop), process_(process), porter_(porter) {}

    Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) override;

private:
    EventLoopThread& loop_;
    MediaProcess& process_;
    FilePorter& porter_;
};

} // namespace tarn
