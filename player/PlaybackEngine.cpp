#include "player/PlaybackEngine.h"

#include <utility>

#include "player/PlaybackItem.h"
#include "player/PlaybackQueuePlayer.h"

namespace tarn {

PlaybackEngine::PlaybackEngine(EventLoop& loop, RenderingFactory& renderings, OutputFactory& outputs,
                               NotificationCenter& notifications)
    : environment_{loop, renderings, outputs, notifications} {}

std::shared_ptr<MediaItem> PlaybackEngine::makeItem(std::shared_ptr<MediaAsset> asset) {
    return std::make_shared<PlaybackItem>(environment_, std::move(asset));
}

std::shared_ptr<MediaQueuePlayer>
PlaybackEngine::makeQueuePlayer(std::vector<std::shared_ptr<MediaItem>> items) {
    return PlaybackQueuePlayer::create(environment_, std::move(items));
}

} // namespace tarn
