#include "proto/Envelope.h"

#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

using Asset = VLProtoAudioFilePlayerAsset;
using PlayerItem = VLProtoAudioFilePlayerItem;
using QueuePlayer = VLProtoAudioFileQueuePlayer;

/// Stores `payload` in one field of a new container and wraps the container.
template <class Container, class Payload>
Envelope envelopeWith(void (Container::*setter)(std::shared_ptr<Payload>), std::shared_ptr<Payload> payload) {
    auto container = std::make_shared<Container>();
    (*container.*setter)(std::move(payload));
    return velmoMessage(std::move(container));
}

} // namespace

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerAsset> container) {
    return VLProtoVelmoMessage::velmoMessageWithSubMessage(std::move(container),
                                                           &VLProtoAudioFilePlayerMessage::setAsset);
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerItem> container) {
    return VLProtoVelmoMessage::velmoMessageWithSubMessage(std::move(container),
                                                           &VLProtoAudioFilePlayerMessage::setPlayerItem);
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayer> container) {
    return VLProtoVelmoMessage::velmoMessageWithSubMessage(std::move(container),
                                                           &VLProtoAudioFilePlayerMessage::setQueuePlayer);
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerAssetUpdateMetaData> payload) {
    return envelopeWith(&Asset::setUpsertWithMetaData, std::move(payload));
}

Envelope velmoMessageForAssetDestroy(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&Asset::setDestroy, std::move(payload));
}

Envelope velmoMessageForPlayerItemUpsertWithAsset(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload) {
    return envelopeWith(&PlayerItem::setUpsertWithAsset, std::move(payload));
}

Envelope velmoMessageForPlayerItemDestroy(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&PlayerItem::setDestroy, std::move(payload));
}

Envelope velmoMessageForPlayerItemSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> payload) {
    return envelopeWith(&PlayerItem::setSetStatus, std::move(payload));
}

Envelope velmoMessageForPlayerItemGetCurrentTime(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&PlayerItem::setGetCurrentTime, std::move(payload));
}

Envelope velmoMessageForPlayerItemNotifyTimeJumped(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&PlayerItem::setNotifyTimeJumped, std::move(payload));
}

Envelope velmoMessageForPlayerItemNotifyDidPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&PlayerItem::setNotifyDidPlayToEndTime, std::move(payload));
}

Envelope velmoMessageForPlayerItemNotifyFailedToPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&PlayerItem::setNotifyFailedToPlayToEndTime, std::move(payload));
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerItemSetCurrentTime> payload) {
    return envelopeWith(&PlayerItem::setSetItemCurrentTime, std::move(payload));
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayerSetItems> payload) {
    return envelopeWith(&QueuePlayer::setUpsertWithItems, std::move(payload));
}

Envelope velmoMessageForQueuePlayerDestroy(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&QueuePlayer::setDestroy, std::move(payload));
}

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayerSetRate> payload) {
    return envelopeWith(&QueuePlayer::setSetRate, std::move(payload));
}

Envelope velmoMessageForQueuePlayerReplaceCurrentItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload) {
    return envelopeWith(&QueuePlayer::setReplaceCurrentItem, std::move(payload));
}

Envelope velmoMessageForQueuePlayerSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> payload) {
    return envelopeWith(&QueuePlayer::setSetStatus, std::move(payload));
}

Envelope velmoMessageForQueuePlayerAdvanceToNextItem(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&QueuePlayer::setAdvanceToNextItem, std::move(payload));
}

Envelope velmoMessageForQueuePlayerAppendItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload) {
    return envelopeWith(&QueuePlayer::setAppendItem, std::move(payload));
}

Envelope velmoMessageForQueuePlayerRemoveItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload) {
    return envelopeWith(&QueuePlayer::setRemoveItem, std::move(payload));
}

Envelope velmoMessageForQueuePlayerRemoveAllItems(std::shared_ptr<VLProtoObjectMessage> payload) {
    return envelopeWith(&QueuePlayer::setRemoveAllItems, std::move(payload));
}

Envelope velmoMessageForQueuePlayerSetCurrentItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload) {
    return envelopeWith(&QueuePlayer::setSetCurrentItem, std::move(payload));
}

} // namespace tarn
