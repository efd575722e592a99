#include "tests/support/ClientCommands.h"

#include "proto/VelmoMessage.h"

namespace tarn::commands {

namespace {

using Asset = VLProtoAudioFilePlayerAsset;
using Item = VLProtoAudioFilePlayerItem;
using Player = VLProtoAudioFileQueuePlayer;

template <class Payload>
std::shared_ptr<Payload> payloadNaming(const Identifier& identifier) {
    auto payload = std::make_shared<Payload>();
    payload->setIdentifier(identifier);
    return payload;
}

std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payloadNaming(const Identifier& identifier,
                                                                               const Identifier& contained) {
    auto payload = payloadNaming<VLProtoAudioFilePlayerUpdateContainedIdentifier>(identifier);
    payload->setContainedIdentifier(contained);
    return payload;
}

/// `payload` in the field of the command container, and that in the field of the message.
template <class Container, class Payload>
Command wrapped(void (VLProtoAudioFilePlayerMessage::*branch)(std::shared_ptr<Container>),
                void (Container::*field)(std::shared_ptr<Payload>), std::shared_ptr<Payload> payload) {
    auto container = std::make_shared<Container>();
    (*container.*field)(std::move(payload));
    auto command = std::make_shared<VLProtoAudioFilePlayerMessage>();
    (*command.*branch)(std::move(container));
    return command;
}

template <class Payload>
Command asset(void (Asset::*field)(std::shared_ptr<Payload>), std::shared_ptr<Payload> payload) {
    return wrapped(&VLProtoAudioFilePlayerMessage::setAsset, field, std::move(payload));
}

template <class Payload>
Command item(void (Item::*field)(std::shared_ptr<Payload>), std::shared_ptr<Payload> payload) {
    return wrapped(&VLProtoAudioFilePlayerMessage::setPlayerItem, field, std::move(payload));
}

template <class Payload>
Command player(void (Player::*field)(std::shared_ptr<Payload>), std::shared_ptr<Payload> payload) {
    return wrapped(&VLProtoAudioFilePlayerMessage::setQueuePlayer, field, std::move(payload));
}

std::shared_ptr<VLProtoObjectMessage> object(const Identifier& identifier) {
    return payloadNaming<VLProtoObjectMessage>(identifier);
}

} // namespace

Command upsertAsset(const AssetFields& fields) {
    auto payload = payloadNaming<VLProtoAudioFilePlayerAssetUpdateMetaData>(fields.identifier);
    payload->setURL(fields.URL);
    payload->setTitle(fields.title);
    payload->setAlbumTitle(fields.albumTitle);
    payload->setArtist(fields.artist);
    payload->setSandboxExtensionToken(fields.sandboxExtensionToken);
    return asset(&Asset::setUpsertWithMetaData, std::move(payload));
}

Command destroyAsset(const Identifier& identifier) { return asset(&Asset::setDestroy, object(identifier)); }

Command upsertItem(const Identifier& identifier, const Identifier& asset) {
    return item(&Item::setUpsertWithAsset, payloadNaming(identifier, asset));
}

Command destroyItem(const Identifier& identifier) { return item(&Item::setDestroy, object(identifier)); }

Command getCurrentTime(const Identifier& identifier) {
    return item(&Item::setGetCurrentTime, object(identifier));
}

Command setCurrentTime(const Identifier& identifier, double seconds) {
    auto payload = payloadNaming<VLProtoAudioFilePlayerItemSetCurrentTime>(identifier);
    payload->setCurrentTime(seconds);
    return item(&Item::setSetItemCurrentTime, std::move(payload));
}

Command upsertPlayer(const Identifier& identifier, const std::vector<std::string>& items) {
    auto payload = payloadNaming<VLProtoAudioFileQueuePlayerSetItems>(identifier);
    payload->setPlayerItemIdentifiers(items);
    return player(&Player::setUpsertWithItems, std::move(payload));
}

Command destroyPlayer(const Identifier& identifier) {
    return player(&Player::setDestroy, object(identifier));
}

Command setRate(const Identifier& identifier, float rate) {
    auto payload = payloadNaming<VLProtoAudioFileQueuePlayerSetRate>(identifier);
    payload->setRate(rate);
    return player(&Player::setSetRate, std::move(payload));
}

Command replaceCurrentItem(const Identifier& identifier, const Identifier& item) {
    return player(&Player::setReplaceCurrentItem, payloadNaming(identifier, item));
}

Command advanceToNextItem(const Identifier& identifier) {
    return player(&Player::setAdvanceToNextItem, object(identifier));
}

Command appendItem(const Identifier& identifier, const Identifier& item) {
    return player(&Player::setAppendItem, payloadNaming(identifier, item));
}

Command removeItem(const Identifier& identifier, const Identifier& item) {
    return player(&Player::setRemoveItem, payloadNaming(identifier, item));
}

Command removeAllItems(const Identifier& identifier) {
    return player(&Player::setRemoveAllItems, object(identifier));
}

Data encoded(const Command& command) {
    VLProtoVelmoMessage envelope;
    envelope.setAudioFilePlayerMessage(command);
    return envelope.serialize();
}

} // namespace tarn::commands
