#include "tests/support/MirroredClient.h"

#include <string>
#include <utility>

#include "proto/AudioFilePlayerCurrentTime.h"

namespace tarn {

namespace {

/// The first field of the command container, which names the command.
std::string nameOf(const ProtoCodable& container) {
    Dictionary fields = container.dictionaryRepresentation();
    return fields.empty() ? "nothing" : fields.begin()->first;
}

/// std::function wants what it holds to be copyable.
std::shared_ptr<Reply> shared(Reply reply) { return std::make_shared<Reply>(std::move(reply)); }

} // namespace

MirroredClient::MirroredClient(const Platform& platform)
    : assets(std::make_shared<VLTorviAudioFilePlayerAssetManager>(platform)),
      items(std::make_shared<VLTorviAudioFilePlayerItemManager>(platform)),
      players(std::make_shared<VLTorviAudioFilePlayerQueuePlayerManager>(platform)),
      playerQueue(platform.queues.create("queue-player commands")),
      itemQueue(platform.queues.create("player-item commands")) {
    assets->setAudioServer(transcript_);
    items->setAudioServer(transcript_);
    players->setAudioServer(transcript_);
    items->setAssetManager(assets);
    players->setAssetManager(assets);
    players->setPlayerItemManager(items);
}

MirroredClient::~MirroredClient() {
    itemQueue->sync([] {});
    playerQueue->sync([] {});
}

void MirroredClient::send(const commands::Command& command) {
    if (auto player = command->queuePlayer()) {
        auto reply = shared(transcript_->reply<VLProtoAudioFilePlayerStatus>(nameOf(*player)));
        playerQueue->async(
            [manager = players, player, reply] { manager->handleMessage(player, std::move(*reply)); });
    } else if (auto item = command->playerItem()) {
        auto reply = shared(item->hasGetCurrentTime()
                                ? transcript_->reply<VLProtoAudioFilePlayerCurrentTime>(nameOf(*item))
                                : transcript_->reply<VLProtoAudioFilePlayerStatus>(nameOf(*item)));
        itemQueue->async([manager = items, item, reply] { manager->handleMessage(item, std::move(*reply)); });
    } else if (auto asset = command->asset()) {
        auto reply = shared(transcript_->reply<VLProtoAudioFilePlayerAssetUpdateMetaData>(nameOf(*asset)));
        playerQueue->async(
            [manager = assets, asset, reply] { manager->handleMessage(asset, std::move(*reply)); });
    }
}

} // namespace tarn
