#pragma once

#include <memory>
#include <optional>
#include <string>

#include "platform/Data.h"
#include "proto/AudioFilePlayerAssetUpdateMetaData.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/Envelope.h"
#include "proto/ObjectMessage.h"
#include "proto/VelmoMessage.h"

namespace tarn::commands {

inline std::shared_ptr<VLProtoObjectMessage> object(const std::string& identifier) {
    auto payload = std::make_shared<VLProtoObjectMessage>();
    payload->setIdentifier(identifier);
    return payload;
}

/// On the player-item queue; answered with error 26 when there is no such item.
inline Data getCurrentTime(const std::string& identifier) {
    return velmoMessageForPlayerItemGetCurrentTime(object(identifier))->serialize();
}

/// On the queue-player queue; answered with error 26 when there is no such item.
inline Data appendItem(const std::string& queuePlayer, const std::string& item) {
    auto payload = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    payload->setIdentifier(queuePlayer);
    payload->setContainedIdentifier(item);
    return velmoMessageForQueuePlayerAppendItem(std::move(payload))->serialize();
}

/// On the queue-player queue; answered with error 24 when there is no such file.
inline Data upsertAsset(const std::string& identifier, const std::string& URL) {
    auto payload = std::make_shared<VLProtoAudioFilePlayerAssetUpdateMetaData>();
    payload->setIdentifier(identifier);
    payload->setURL(URL);
    return velmoMessage(std::move(payload))->serialize();
}

/// On the queue-player queue; never answered.
inline Data destroyAsset(const std::string& identifier) {
    return velmoMessageForAssetDestroy(object(identifier))->serialize();
}

/// Not for this service; never answered.
inline Data nothingButAPlist() {
    VLProtoVelmoMessage envelope;
    envelope.setPlist(std::make_shared<VLProtoVelmoPlist>());
    return envelope.serialize();
}

} // namespace tarn::commands
