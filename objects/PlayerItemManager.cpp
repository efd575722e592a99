#include "objects/PlayerItemManager.h"

#include <utility>

#include "objects/AssetManager.h"
#include "objects/CommandTable.h"
#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/AudioFilePlayerItemSetCurrentTime.h"
#include "proto/AudioFilePlayerStatus.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/ObjectMessage.h"
#include "roles/MediaEngine.h"

namespace tarn {

namespace {

constexpr std::int32_t seekTimescale = 60;

} // namespace

VLTorviAudioFilePlayerItemManager::VLTorviAudioFilePlayerItemManager(const Platform& platform)
    : VLTorviAudioFilePlayerObjectManager(platform, "VLTorviAudioFilePlayerItemManager") {}

std::shared_ptr<VLTorviAudioFilePlayerAssetManager> VLTorviAudioFilePlayerItemManager::assetManager() const {
    return assetManager_.withLocked([](const auto& assetManager) { return assetManager; });
}

void VLTorviAudioFilePlayerItemManager::setAssetManager(
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager) {
    assetManager_.withLocked([&](auto& current) { current.swap(assetManager); });
}

void VLTorviAudioFilePlayerItemManager::handleMessage(
    const std::shared_ptr<VLProtoAudioFilePlayerItem>& message, Reply reply) {
    using Message = VLProtoAudioFilePlayerItem;
    using Manager = VLTorviAudioFilePlayerItemManager;
    static constexpr std::tuple commands{
        Command{&Message::upsertWithAsset, &Manager::_serveUpsert},
        Command{&Message::destroy, &Manager::_serveDestroy},
        Command{&Message::getCurrentTime, &Manager::_serveGetCurrentTime},
        Command{&Message::setItemCurrentTime, &Manager::_serveSetItemCurrentTime},
    };
    serveFirstCommand(commands, *this, *message, std::move(reply));
}

void VLTorviAudioFilePlayerItemManager::_serveUpsert(
    const VLProtoAudioFilePlayerUpdateContainedIdentifier& payload, Reply reply) {
    if (!requireIdentifier(payload.identifier(), "upsertWithAsset", reply))
        return;
    auto assets = assetManager();
    auto asset = assets ? assets->assetWithIdentifier(payload.containedIdentifier()) : nullptr;
    if (asset)
        upsertItemWithIdentifier(*payload.identifier(), std::move(asset), std::move(reply));
    else
        _reportMissingAssetWithID(payload.containedIdentifier(), "upsertWithAsset", reply);
}

void VLTorviAudioFilePlayerItemManager::_serveDestroy(const VLProtoObjectMessage& payload, Reply) {
    if (requireIdentifier(payload.identifier(), "destroy"))
        destroyPlayerItemWithIdentifier(*payload.identifier());
}

void VLTorviAudioFilePlayerItemManager::_serveGetCurrentTime(const VLProtoObjectMessage& payload,
                                                             Reply reply) {
    auto item = playerItemWithIdentifier(payload.identifier());
    if (!item) {
        _reportMissingAssetWithID(payload.identifier(), "getCurrentTime", reply);
        return;
    }
    VLProtoAudioFilePlayerCurrentTime answer;
    answer.setCurrentTime(item->currentTime().seconds());
    reply.data(answer.serialize());
}

void VLTorviAudioFilePlayerItemManager::_serveSetItemCurrentTime(
    const VLProtoAudioFilePlayerItemSetCurrentTime& payload, Reply reply) {
    if (auto item = playerItemWithIdentifier(payload.identifier()))
        item->seekToTime(MediaTime::fromSeconds(payload.currentTime(), seekTimescale));
    else
        _reportMissingAssetWithID(payload.identifier(), "setItemCurrentTime", reply);
}

void VLTorviAudioFilePlayerItemManager::upsertItemWithIdentifier(const std::string& identifier,
                                                                 std::shared_ptr<MediaAsset> asset,
                                                                 Reply reply) {
    auto charged = charge(ObjectAccount::ofItem + 2 * identifier.size(), "upsertWithAsset", reply);
    if (!charged)
        return;
    std::shared_ptr<MediaItem> playerItem = platform().media.makeItem(std::move(asset));
    identifierToObjectMap_.setObject(identifier,
                                     VLTorviAudioFilePlayerItem::initWithPlayerItem(
                                         platform().notifications, playerItem, identifier, audioServer()),
                                     *std::move(charged));
    reply.data(
        VLProtoAudioFilePlayerStatus::statusMessageFromPlayerItem(*playerItem, std::nullopt)->serialize());
}

void VLTorviAudioFilePlayerItemManager::destroyPlayerItemWithIdentifier(const std::string& identifier) {
    identifierToObjectMap_.removeObject(identifier);
}

std::shared_ptr<MediaItem> VLTorviAudioFilePlayerItemManager::playerItemWithIdentifier(
    const std::optional<std::string>& identifier) const {
    auto wrapper = identifierToObjectMap_.objectWithIdentifier(identifier);
    return wrapper ? wrapper->playerItem() : nullptr;
}

std::optional<std::string>
VLTorviAudioFilePlayerItemManager::identifierForPlayerItem(const MediaItem* playerItem) const {
    return identifierToObjectMap_.identifierForMediaObject(playerItem);
}

} // namespace tarn
