#include "queueplayer/QueuePlayer.h"

#include <atomic>
#include <chrono>
#include <utility>

#include "log/SystemLog.h"
#include "objects/PlayerItemManager.h"
#include "proto/AudioFilePlayerStatus.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/AudioFileQueuePlayerSetRate.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "roles/AudioSession.h"
#include "roles/Clock.h"
#include "roles/RateThreshold.h"

namespace tarn {

namespace {

constexpr std::chrono::seconds activationLimit{17};
constexpr char setRateMethod[] = "-[VLTorviAudioFileQueuePlayer setRate:]";

} // namespace

/// Shared by the caller who waits and the completion, which may come after the caller has gone.
struct VLTorviAudioFileQueuePlayer::Activation {
    std::shared_ptr<OneShotSignal> finished;
    std::atomic<bool> applied{false};
};

std::shared_ptr<VLTorviAudioFileQueuePlayer> VLTorviAudioFileQueuePlayer::initWithQueuePlayer(
    const Platform& platform, std::shared_ptr<MediaQueuePlayer> queuePlayer, std::string identifier,
    std::shared_ptr<EventSink> audioServer,
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager,
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager) {
    std::shared_ptr<VLTorviAudioFileQueuePlayer> player(new VLTorviAudioFileQueuePlayer(
        platform, std::move(queuePlayer), std::move(identifier), std::move(audioServer),
        std::move(playerItemManager), std::move(assetManager)));
    player->startObserving();
    player->_registerForAudioSessionNotifications();
    player->_registerTelecueSupportedCommands();
    player->_updateTelecueSupportedCommandsForCurrentItem();
    return player;
}

VLTorviAudioFileQueuePlayer::VLTorviAudioFileQueuePlayer(
    const Platform& platform, std::shared_ptr<MediaQueuePlayer> queuePlayer, std::string identifier,
    std::shared_ptr<EventSink> audioServer,
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager,
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager)
    : platform_(platform),
      identifier_(std::move(identifier)),
      queuePlayer_(std::move(queuePlayer)),
      audioServer_(std::move(audioServer)),
      playerItemManager_(std::move(playerItemManager)),
      assetManager_(std::move(assetManager)) {}

void VLTorviAudioFileQueuePlayer::startObserving() {
    statusObserver_ = observe(MediaQueuePlayer::statusKeyPath, &VLTorviAudioFileQueuePlayer::_reportStatus);
    rateObserver_ = observe(MediaQueuePlayer::rateKeyPath, &VLTorviAudioFileQueuePlayer::_reportRate);
    currentItemObserver_ =
        observe(MediaQueuePlayer::currentItemKeyPath, &VLTorviAudioFileQueuePlayer::_reportCurrentItem);
}

std::unique_ptr<VLTorviKeyValueObserverHelper>
VLTorviAudioFileQueuePlayer::observe(std::string_view keyPath,
                                     void (VLTorviAudioFileQueuePlayer::*report)()) {
    return VLTorviKeyValueObserverHelper::startObservingObject(
        *queuePlayer_, keyPath, [weakSelf = weak_from_this(), report](Observable&, const ChangeDescription&) {
            if (auto self = weakSelf.lock())
                (self.get()->*report)();
        });
}

void VLTorviAudioFileQueuePlayer::_reportStatus() {
    auto status = VLProtoAudioFilePlayerStatus::statusMessageFromPlayer(*queuePlayer_, identifier_);
    send(*velmoMessageForQueuePlayerSetStatus(std::move(status)));
}

void VLTorviAudioFileQueuePlayer::_reportRate() {
    _updateTelecueForCurrentItem();
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetRate>();
    message->setIdentifier(identifier_);
    message->setRate(queuePlayer_->rate());
    send(*velmoMessage(std::move(message)));
}

void VLTorviAudioFileQueuePlayer::_reportCurrentItem() {
    _updateTelecueForCurrentItem();
    auto message = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    message->setIdentifier(identifier_);
    if (auto item = queuePlayer_->currentItem(); item && playerItemManager_)
        message->setContainedIdentifier(playerItemManager_->identifierForPlayerItem(item.get()));
    send(*velmoMessageForQueuePlayerSetCurrentItem(std::move(message)));
}

void VLTorviAudioFileQueuePlayer::send(const VLProtoVelmoMessage& envelope) {
    if (audioServer_)
        audioServer_->sendData(envelope.serialize());
}

void VLTorviAudioFileQueuePlayer::close() {
    for (auto* observer : {&statusObserver_, &rateObserver_, &currentItemObserver_})
        (*observer)->stopObservingObject();
    queuePlayer_->removeAllItems();
}

bool VLTorviAudioFileQueuePlayer::play() { return setRate(1); }

bool VLTorviAudioFileQueuePlayer::pause() {
    if (!queuePlayer_->currentItem())
        return false;
    queuePlayer_->pause();
    return true;
}

bool VLTorviAudioFileQueuePlayer::isPlaying() const { return !isZeroRate(queuePlayer_->rate()); }

bool VLTorviAudioFileQueuePlayer::togglePlayPause() { return isPlaying() ? pause() : play(); }

bool VLTorviAudioFileQueuePlayer::setRate(float rate) {
    if (isZeroRate(rate))
        return pause();

    auto activation = std::make_shared<Activation>();
    activation->finished = platform_.clock.makeSignal();
    platform_.audioSession.activateWithOptions(0, [self = shared_from_this(), activation,
                                                   rate](bool success, const std::optional<Error>& error) {
        if (success) {
            self->queuePlayer_->setRate(rate);
            activation->applied = true;
        } else {
            SystemLog::error(setRateMethod, __LINE__,
                             "%{public}s:%d: Could not set audio session active due to error: %{public}@.",
                             describe(error));
            if (error)
                self->queuePlayer_->soundFailed(*error);
        }
        activation->finished->signal();
    });
    if (!activation->finished->wait(activationLimit))
        SystemLog::error(setRateMethod, __LINE__,
                         "%{public}s:%d: Timed out waiting for response from "
                         "activateWithOptions:completionHandler:");
    return activation->applied;
}

void VLTorviAudioFileQueuePlayer::_registerForAudioSessionNotifications() {
    interruptions_ =
        platform_.notifications.addObserver(AudioSession::interruptionNotification, &platform_.audioSession,
                                            [weakSelf = weak_from_this()](const Notification& notification) {
                                                if (auto self = weakSelf.lock())
                                                    self->_handleInterruptionNotification(notification);
                                            });
}

void VLTorviAudioFileQueuePlayer::_handleInterruptionNotification(const Notification& notification) {
    auto type = notification.info.find(AudioSession::interruptionTypeKey);
    if (type == notification.info.end() || type->second != AudioSession::interruptionEnded)
        return;
    auto options = notification.info.find(AudioSession::interruptionOptionsKey);
    if (options != notification.info.end() && options->second == AudioSession::optionShouldResume)
        queuePlayer_->play();
}

} // namespace tarn
