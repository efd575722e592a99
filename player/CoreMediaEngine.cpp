#include "player/CoreMediaEngine.h"

#include <utility>

#include "player/CoreMediaItem.h"
#include "player/CoreQueuePlayer.h"

namespace tarn {

CoreMediaEngine::CoreMediaEngine(PlayerLoop& loop, RenderingFactory& renderings, OutputFactory& outputs,
                                 NotificationCenter& notifications)
    : environment_{loop, renderings, outputs, notifications} {}

std::shared_ptr<MediaItem> CoreMediaEngine::makeItem(std::shared_ptr<MediaAsset> asset) {
    return std::make_shared<CoreMediaItem>(environment_, std::move(asset));
}

std::shared_ptr<MediaQueuePlayer>
CoreMediaEngine::makeQueuePlayer(std::vector<std::shared_ptr<MediaItem>> items) {
    return CoreQueuePlayer::create(environment_, std::move(items));
}

} // namespace tarn
