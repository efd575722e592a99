#include "objects/PlayerItem.h"

#include <utility>

#include "proto/AudioFilePlayerStatus.h"
#include "proto/Envelope.h"
#include "proto/ObjectMessage.h"
#include "proto/VelmoMessage.h"

namespace tarn {

std::shared_ptr<VLTorviAudioFilePlayerItem>
VLTorviAudioFilePlayerItem::initWithPlayerItem(NotificationCenter& notifications,
                                               std::shared_ptr<MediaItem> playerItem, std::string identifier,
                                               std::shared_ptr<EventSink> audioServer) {
    std::shared_ptr<VLTorviAudioFilePlayerItem> item(
        new VLTorviAudioFilePlayerItem(std::move(playerItem), std::move(identifier), std::move(audioServer)));
    item->startObserving(notifications);
    return item;
}

VLTorviAudioFilePlayerItem::VLTorviAudioFilePlayerItem(std::shared_ptr<MediaItem> playerItem,
                                                       std::string identifier,
                                                       std::shared_ptr<EventSink> audioServer)
    : playerItem_(std::move(playerItem)),
      audioServer_(std::move(audioServer)),
      identifier_(std::move(identifier)) {}

void VLTorviAudioFilePlayerItem::startObserving(NotificationCenter& notifications) {
    // Weakly, or the observation would keep the wrapper, and the wrapper keeps the observation.
    statusObserver_ = VLTorviKeyValueObserverHelper::startObservingObject(
        *playerItem_, MediaItem::statusKeyPath,
        [weakSelf = weak_from_this()](Observable&, const ChangeDescription&) {
            if (auto self = weakSelf.lock())
                self->_reportStatus();
        });
    notifications_ = notifications.addObserver(
        {MediaItem::didPlayToEndTime, MediaItem::failedToPlayToEndTime, MediaItem::timeJumped},
        playerItem_.get(), [weakSelf = weak_from_this()](const Notification& notification) {
            if (auto self = weakSelf.lock())
                self->handleNotification(notification.name);
        });
}

void VLTorviAudioFilePlayerItem::handleNotification(std::string_view name) {
    if (name == MediaItem::didPlayToEndTime)
        _playerItemDidReachEnd();
    else if (name == MediaItem::failedToPlayToEndTime)
        _playerItemFailedToReachEnd();
    else
        _playerItemTimeJumped();
}

void VLTorviAudioFilePlayerItem::_reportStatus() {
    auto status = VLProtoAudioFilePlayerStatus::statusMessageFromPlayerItem(*playerItem_, identifier_);
    send(*velmoMessageForPlayerItemSetStatus(std::move(status)));
}

void VLTorviAudioFilePlayerItem::_playerItemDidReachEnd() {
    send(*velmoMessageForPlayerItemNotifyDidPlayToEndTime(objectMessage()));
}

void VLTorviAudioFilePlayerItem::_playerItemFailedToReachEnd() {
    send(*velmoMessageForPlayerItemNotifyFailedToPlayToEndTime(objectMessage()));
}

void VLTorviAudioFilePlayerItem::_playerItemTimeJumped() {
    send(*velmoMessageForPlayerItemNotifyTimeJumped(objectMessage()));
}

std::shared_ptr<VLProtoObjectMessage> VLTorviAudioFilePlayerItem::objectMessage() const {
    auto message = std::make_shared<VLProtoObjectMessage>();
    message->setIdentifier(identifier_);
    return message;
}

void VLTorviAudioFilePlayerItem::send(const VLProtoVelmoMessage& envelope) {
    if (audioServer_)
        audioServer_->sendData(envelope.serialize());
}

} // namespace tarn
