#pragma once

#include "player/PlayerEnvironment.h"
#include "roles/MediaEngine.h"

namespace tarn {

/// The items and players of an engine. What opens files, renders and sounds is given to it, and openAsset()
/// is left to the engine that derives from it.
class PlaybackEngine : public MediaEngine {
public:
    /// All of these outlive the engine, and the engine every item and player that it made.
    PlaybackEngine(EventLoop& loop, RenderingFactory& renderings, OutputFactory& outputs,
                   NotificationCenter& notifications);

    std::shared_ptr<MediaItem> makeItem(std::shared_ptr<MediaAsset> asset) final;
    std::shared_ptr<MediaQueuePlayer> makeQueuePlayer(std::vector<std::shared_ptr<MediaItem>> items) final;

private:
    PlayerEnvironment environment_;
};

} // namespace tarn
