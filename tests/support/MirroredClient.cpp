#include "tests/support/MirroredClient.h"

#include <string>
#include <utility>

#include "proto/AudioFilePlayerCurrentTime.h"

namespace tarn {

namespace {

std::shared_ptr<VLTorviAudioFilePlayerServer> routerTo(const std::shared_ptr<Transcript>& transcript,
                                                       const Platform& platform) {
    auto router = std::make_shared<VLTorviAudioFilePlayerServer>(platform);
    router->setAudioServer(transcript);
    return router;
}

/// The first field of the command container, which names the command.
std::string nameOf(const VLProtoAudioFilePlayerMessage& command) {
    Dictionary kind = command.dictionaryRepresentation();
    const auto& fields = std::get<Dictionary>(kind.begin()->second.value);
    return fields.begin()->first;
}

} // namespace

MirroredClient::MirroredClient(const Platform& platform)
    : router_(routerTo(transcript_, platform)),
      assets(router_->assetManagerCreateIfNeeded()),
      items(router_->playerItemManagerCreateIfNeeded()),
      players(router_->queuePlayerManagerCreateIfNeeded()) {}

Reply MirroredClient::replyTo(const VLProtoAudioFilePlayerMessage& command) {
    std::string name = nameOf(command);
    if (command.hasAsset())
        return transcript_->reply<VLProtoAudioFilePlayerAssetUpdateMetaData>(name);
    if (command.hasPlayerItem() && command.playerItem()->hasGetCurrentTime())
        return transcript_->reply<VLProtoAudioFilePlayerCurrentTime>(name);
    return transcript_->reply<VLProtoAudioFilePlayerStatus>(name);
}

void MirroredClient::send(const commands::Command& command, Reply reply) {
    router_->handleMessage(command, std::move(reply));
}

} // namespace tarn
