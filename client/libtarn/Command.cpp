#include "client/libtarn/Command.h"

#include <memory>
#include <utility>

#include "client/libtarn/Decoding.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"

namespace tarn::commands {

namespace {

using client::Answer;
using Time = Mirror::Time;

std::shared_ptr<VLProtoObjectMessage> object(const std::string& identifier) {
    auto message = std::make_shared<VLProtoObjectMessage>();
    message->setIdentifier(identifier);
    return message;
}

std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> pair(const std::string& identifier,
                                                                      const std::string& contained) {
    auto message = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    message->setIdentifier(identifier);
    message->setContainedIdentifier(contained);
    return message;
}

} // namespace

Command upsertAsset(const client::AssetUpsert& asset) {
    auto message = std::make_shared<VLProtoAudioFilePlayerAssetUpdateMetaData>();
    message->setIdentifier(asset.identifier);
    message->setURL(asset.URL);
    message->setTitle(asset.title);
    message->setAlbumTitle(asset.albumTitle);
    message->setArtist(asset.artist);
    message->setSandboxExtensionToken(asset.sandboxExtensionToken);
    return {velmoMessage(std::move(message))->serialize(),
            [asset](Mirror& mirror, const Answer& answer, Time) {
                const auto info = decodeAssetInfo(answer.data.value_or(Data()));
                mirror.assetMade(asset, info ? info->duration : 0);
            }};
}

Command destroyAsset(const std::string& asset) {
    return {velmoMessageForAssetDestroy(object(asset))->serialize(),
            [asset](Mirror& mirror, const Answer&, Time) { mirror.assetDestroyed(asset); }};
}

Command upsertItem(const std::string& item, const std::string& asset) {
    return {velmoMessageForPlayerItemUpsertWithAsset(pair(item, asset))->serialize(),
            [item, asset](Mirror& mirror, const Answer& answer, Time) {
                const auto status = decodeStatus(answer.data.value_or(Data()));
                mirror.itemMade(item, asset, status ? std::optional(status->value) : std::nullopt);
            }};
}

Command destroyItem(const std::string& item) {
    return {velmoMessageForPlayerItemDestroy(object(item))->serialize(),
            [item](Mirror& mirror, const Answer&, Time) { mirror.itemDestroyed(item); }};
}

Command currentTime(const std::string& item) {
    return {velmoMessageForPlayerItemGetCurrentTime(object(item))->serialize(),
            [item](Mirror& mirror, const Answer& answer, Time now) {
                if (const auto seconds = decodeCurrentTime(answer.data.value_or(Data())))
                    mirror.positionHeard(item, *seconds, now);
            }};
}

Command setCurrentTime(const std::string& item, double seconds) {
    auto message = std::make_shared<VLProtoAudioFilePlayerItemSetCurrentTime>();
    message->setIdentifier(item);
    message->setCurrentTime(seconds);
    return {velmoMessage(std::move(message))->serialize(),
            [item, seconds](Mirror& mirror, const Answer&, Time now) {
                mirror.positionMoved(item, seconds, now);
            }};
}

Command upsertQueuePlayer(const std::string& player, const std::vector<std::string>& items) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetItems>();
    message->setIdentifier(player);
    for (const auto& item : items)
        message->addPlayerItemIdentifiers(item);
    return {
        velmoMessage(std::move(message))->serialize(),
        [player, items](Mirror& mirror, const Answer&, Time now) { mirror.playerMade(player, items, now); }};
}

Command destroyQueuePlayer(const std::string& player) {
    return {velmoMessageForQueuePlayerDestroy(object(player))->serialize(),
            [player](Mirror& mirror, const Answer&, Time now) { mirror.playerDestroyed(player, now); }};
}

/// The mirror learns the rate from the event: the service releases the command also when no sound is to be
/// had.
Command setRate(const std::string& player, float rate) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetRate>();
    message->setIdentifier(player);
    message->setRate(rate);
    return {velmoMessage(std::move(message))->serialize()};
}

/// The mirror learns it from the event.
Command advanceToNextItem(const std::string& player) {
    return {.envelope = velmoMessageForQueuePlayerAdvanceToNextItem(object(player))->serialize(),
            .advances = player};
}

Command appendItem(const std::string& player, const std::string& item) {
    return {
        velmoMessageForQueuePlayerAppendItem(pair(player, item))->serialize(),
        [player, item](Mirror& mirror, const Answer&, Time now) { mirror.itemAppended(player, item, now); }};
}

Command removeItem(const std::string& player, const std::string& item) {
    return {
        velmoMessageForQueuePlayerRemoveItem(pair(player, item))->serialize(),
        [player, item](Mirror& mirror, const Answer&, Time now) { mirror.itemRemoved(player, item, now); }};
}

Command removeAllItems(const std::string& player) {
    return {velmoMessageForQueuePlayerRemoveAllItems(object(player))->serialize(),
            [player](Mirror& mirror, const Answer&, Time now) { mirror.allItemsRemoved(player, now); }};
}

Command replaceCurrentItem(const std::string& player, const std::string& item) {
    return {velmoMessageForQueuePlayerReplaceCurrentItem(pair(player, item))->serialize(),
            [player, item](Mirror& mirror, const Answer&, Time now) {
                mirror.currentItemReplaced(player, item, now);
            }};
}

} // namespace tarn::commands
