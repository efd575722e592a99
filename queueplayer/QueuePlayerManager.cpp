#include "queueplayer/QueuePlayerManager.h"

#include <utility>

#include "log/SystemLog.h"
#include "objects/AssetManager.h"
#include "objects/CommandTable.h"
#include "objects/PlayerItemManager.h"
#include "proto/AudioFilePlayerStatus.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/AudioFileQueuePlayerSetItems.h"
#include "proto/AudioFileQueuePlayerSetRate.h"
#include "proto/ObjectMessage.h"
#include "roles/AudioSession.h"
#include "roles/MediaEngine.h"

namespace tarn {

VLTorviAudioFilePlayerQueuePlayerManager::VLTorviAudioFilePlayerQueuePlayerManager(const Platform& platform)
    : VLTorviAudioFilePlayerObjectManager(platform, "VLTorviAudioFilePlayerQueuePlayerManager") {}

std::shared_ptr<VLTorviAudioFilePlayerItemManager>
VLTorviAudioFilePlayerQueuePlayerManager::playerItemManager() const {
    return playerItemManager_.withLocked([](const auto& manager) { return manager; });
}

void VLTorviAudioFilePlayerQueuePlayerManager::setPlayerItemManager(
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager) {
    playerItemManager_.withLocked([&](auto& current) { current.swap(playerItemManager); });
}

std::shared_ptr<VLTorviAudioFilePlayerAssetManager>
VLTorviAudioFilePlayerQueuePlayerManager::assetManager() const {
    return assetManager_.withLocked([](const auto& manager) { return manager; });
}

void VLTorviAudioFilePlayerQueuePlayerManager::setAssetManager(
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager) {
    assetManager_.withLocked([&](auto& current) { current.swap(assetManager); });
}

void VLTorviAudioFilePlayerQueuePlayerManager::handleMessage(
    const std::shared_ptr<VLProtoAudioFileQueuePlayer>& message, Reply reply) {
    using Message = VLProtoAudioFileQueuePlayer;
    using Manager = VLTorviAudioFilePlayerQueuePlayerManager;
    static constexpr std::tuple commands{
        Command{&Message::setRate, &Manager::_serveSetRate},
        Command{&Message::upsertWithItems, &Manager::_serveUpsert},
        Command{&Message::destroy, &Manager::_serveDestroy},
        Command{&Message::advanceToNextItem, &Manager::_serveAdvanceToNextItem},
        Command{&Message::appendItem, &Manager::_serveAppendItem},
        Command{&Message::removeItem, &Manager::_serveRemoveItem},
        Command{&Message::removeAllItems, &Manager::_serveRemoveAllItems},
        Command{&Message::replaceCurrentItem, &Manager::_serveReplaceCurrentItem},
    };
    serveFirstCommand(commands, *this, *message, std::move(reply));
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveSetRate(
    const VLProtoAudioFileQueuePlayerSetRate& payload, Reply) {
    if (!requireIdentifier(payload.identifier(), "setRate"))
        return;
    if (auto player = identifierToObjectMap_.objectWithIdentifier(payload.identifier()))
        player->setRate(payload.rate());
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveUpsert(
    const VLProtoAudioFileQueuePlayerSetItems& payload, Reply reply) {
    if (!requireIdentifier(payload.identifier(), "upsertWithItems", reply))
        return;
    std::vector<std::shared_ptr<MediaItem>> items;
    for (std::size_t index = 0; index < payload.playerItemIdentifiersCount(); ++index) {
        const std::string itemIdentifier(payload.playerItemIdentifiersAtIndex(index));
        auto item = playerItemWithIdentifier(itemIdentifier);
        if (!item) {
            _reportMissingAssetWithID(itemIdentifier, "upsertWithItems", reply);
            return;
        }
        items.push_back(std::move(item));
    }
    upsertQueuePlayerWithIdentifier(*payload.identifier(), std::move(items), std::move(reply));
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveDestroy(const ObjectPayload& payload, Reply) {
    if (requireIdentifier(payload.identifier(), "destroy"))
        destroyQueuePlayerWithIdentifier(*payload.identifier());
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveAdvanceToNextItem(const ObjectPayload& payload, Reply) {
    if (!requireIdentifier(payload.identifier(), "advanceToNextItem"))
        return;
    if (auto player = queuePlayerWithIdentifier(payload.identifier()))
        player->advanceToNextItem();
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveAppendItem(const ContainedPayload& payload,
                                                                Reply reply) {
    if (Edit edit = editOf(payload, "appendItem", reply))
        edit.queuePlayer->insertItem(std::move(edit.item), nullptr);
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveRemoveItem(const ContainedPayload& payload,
                                                                Reply reply) {
    if (Edit edit = editOf(payload, "removeItem", reply))
        edit.queuePlayer->removeItem(edit.item);
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveRemoveAllItems(const ObjectPayload& payload, Reply) {
    if (!requireIdentifier(payload.identifier(), "removeAllItems"))
        return;
    if (auto player = queuePlayerWithIdentifier(payload.identifier()))
        player->removeAllItems();
}

void VLTorviAudioFilePlayerQueuePlayerManager::_serveReplaceCurrentItem(const ContainedPayload& payload,
                                                                        Reply reply) {
    if (Edit edit = editOf(payload, "replaceCurrentItem", reply))
        edit.queuePlayer->replaceCurrentItem(std::move(edit.item));
}

/// A missing item is reported, and answered with error 26, whether the queue player is known or not.
VLTorviAudioFilePlayerQueuePlayerManager::Edit
VLTorviAudioFilePlayerQueuePlayerManager::editOf(const ContainedPayload& payload, std::string_view command,
                                                 Reply& reply) {
    Edit edit{queuePlayerWithIdentifier(payload.identifier()),
              playerItemWithIdentifier(payload.containedIdentifier())};
    if (!edit.item)
        _reportMissingAssetWithID(payload.containedIdentifier(), command, reply);
    else
        (void)requireIdentifier(payload.identifier(), command);
    return edit;
}

std::shared_ptr<MediaItem> VLTorviAudioFilePlayerQueuePlayerManager::playerItemWithIdentifier(
    const std::optional<std::string>& identifier) const {
    auto manager = playerItemManager();
    return manager ? manager->playerItemWithIdentifier(identifier) : nullptr;
}

void VLTorviAudioFilePlayerQueuePlayerManager::upsertQueuePlayerWithIdentifier(
    const std::string& identifier, std::vector<std::shared_ptr<MediaItem>> playerItems, Reply reply) {
    auto charged = charge(ObjectAccount::ofQueuePlayer + 2 * identifier.size() +
                              ObjectAccount::ofQueuedItem * playerItems.size(),
                          "upsertWithItems", reply);
    if (!charged)
        return;
    std::shared_ptr<MediaQueuePlayer> queuePlayer = platform().media.makeQueuePlayer(std::move(playerItems));
    queuePlayer->setAudioSession(platform().audioSession);
    setupAudioSession(*queuePlayer->audioSession());
    auto items = playerItemManager();
    auto player = VLTorviAudioFileQueuePlayer::initWithQueuePlayer(platform(), queuePlayer, identifier,
                                                                   audioServer(), items, assetManager());
    made_.withLocked([&](auto& players) {
        if (players.size() == players.capacity()) // rather than grow for those that are gone
            std::erase_if(players, [](const auto& made) { return made.expired(); });
        players.push_back(player);
    });
    identifierToObjectMap_.setObject(identifier, std::move(player), *std::move(charged));

    // The answer names the current item, not the queue player.
    auto currentItem = queuePlayer->currentItem();
    auto currentIdentifier =
        currentItem && items ? items->identifierForPlayerItem(currentItem.get()) : std::nullopt;
    reply.data(
        VLProtoAudioFilePlayerStatus::statusMessageFromPlayer(*queuePlayer, currentIdentifier)->serialize());
}

void VLTorviAudioFilePlayerQueuePlayerManager::destroyQueuePlayerWithIdentifier(
    const std::string& identifier) {
    identifierToObjectMap_.removeObject(identifier);
}

void VLTorviAudioFilePlayerQueuePlayerManager::close() {
    identifierToObjectMap_.close();
    for (const auto& made : made_.withLocked([](auto& players) { return std::exchange(players, {}); }))
        if (auto held = made.lock())
            held->close();
}

std::shared_ptr<MediaQueuePlayer> VLTorviAudioFilePlayerQueuePlayerManager::queuePlayerWithIdentifier(
    const std::optional<std::string>& identifier) const {
    auto wrapper = identifierToObjectMap_.objectWithIdentifier(identifier);
    return wrapper ? wrapper->queuePlayer() : nullptr;
}

void VLTorviAudioFilePlayerQueuePlayerManager::setupAudioSession(AudioSession& session) {
    auto error = session.setCategory(AudioSession::Category::playback, AudioSession::Mode::standard,
                                     AudioSession::RouteSharingPolicy::longForm, 0);
    if (error)
        SystemLog::error("-[VLTorviAudioFilePlayerQueuePlayerManager setupAudioSession:]", __LINE__,
                         "%{public}s:%d: Could not set audio session category due to error: %{public}@.",
                         describe(*error));
}

} // namespace tarn
