#pragma once

#include <memory>

namespace tarn {

class VLProtoAudioFilePlayerAsset;
class VLProtoAudioFilePlayerAssetUpdateMetaData;
class VLProtoAudioFilePlayerItem;
class VLProtoAudioFilePlayerItemSetCurrentTime;
class VLProtoAudioFilePlayerStatus;
class VLProtoAudioFilePlayerUpdateContainedIdentifier;
class VLProtoAudioFileQueuePlayer;
class VLProtoAudioFileQueuePlayerSetItems;
class VLProtoAudioFileQueuePlayerSetRate;
class VLProtoObjectMessage;
class VLProtoVelmoMessage;

// Each of these wraps a message into a complete envelope. The message itself is stored, not a copy: changing
// it afterwards changes the envelope.

using Envelope = std::shared_ptr<VLProtoVelmoMessage>;

Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerAsset> container);
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerItem> container);
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayer> container);

// About an asset.
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerAssetUpdateMetaData> payload);
Envelope velmoMessageForAssetDestroy(std::shared_ptr<VLProtoObjectMessage> payload);

// About a player item.
Envelope velmoMessageForPlayerItemUpsertWithAsset(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload);
Envelope velmoMessageForPlayerItemDestroy(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForPlayerItemSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> payload);
Envelope velmoMessageForPlayerItemGetCurrentTime(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForPlayerItemNotifyTimeJumped(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForPlayerItemNotifyDidPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForPlayerItemNotifyFailedToPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFilePlayerItemSetCurrentTime> payload);

// About a queue player.
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayerSetItems> payload);
Envelope velmoMessageForQueuePlayerDestroy(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessage(std::shared_ptr<VLProtoAudioFileQueuePlayerSetRate> payload);
Envelope velmoMessageForQueuePlayerReplaceCurrentItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload);
Envelope velmoMessageForQueuePlayerSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> payload);
Envelope velmoMessageForQueuePlayerAdvanceToNextItem(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForQueuePlayerAppendItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload);
Envelope velmoMessageForQueuePlayerRemoveItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload);
Envelope velmoMessageForQueuePlayerRemoveAllItems(std::shared_ptr<VLProtoObjectMessage> payload);
Envelope velmoMessageForQueuePlayerSetCurrentItem(
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> payload);

} // namespace tarn
