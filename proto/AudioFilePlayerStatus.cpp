#include "proto/AudioFilePlayerStatus.h"

#include "proto/ErrorUserInfo.h"
#include "roles/Error.h"
#include "roles/MediaItem.h"
#include "roles/MediaQueuePlayer.h"

namespace tarn {

std::shared_ptr<VLProtoAudioFilePlayerStatus>
VLProtoAudioFilePlayerStatus::statusMessageFromPlayerItem(const MediaItem& playerItem,
                                                          std::optional<std::string> identifier) {
    return _statusMessageStatus(playerItem.status(), playerItem.error(), std::move(identifier));
}

std::shared_ptr<VLProtoAudioFilePlayerStatus>
VLProtoAudioFilePlayerStatus::statusMessageFromPlayer(const MediaQueuePlayer& player,
                                                      std::optional<std::string> identifier) {
    return _statusMessageStatus(player.status(), player.error(), std::move(identifier));
}

std::shared_ptr<VLProtoAudioFilePlayerStatus>
VLProtoAudioFilePlayerStatus::_statusMessageStatus(MediaStatus status, const std::optional<Error>& error,
                                                   std::optional<std::string> identifier) {
    auto message = std::make_shared<VLProtoAudioFilePlayerStatus>();
    message->setIdentifier(std::move(identifier));
    message->setStatus(static_cast<std::int32_t>(status));
    if (error) {
        message->setErrorDomain(error->domain);
        message->setErrorCode(error->code);
        message->setErrorDict(VLMakeDataFromErrorUserInfo(error->userInfo));
    }
    return message;
}

} // namespace tarn
