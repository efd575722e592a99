// The media controls of the system: which of them a queue player answers, and what it shows there.

#include "objects/AssetManager.h"
#include "objects/FileName.h"
#include "queueplayer/QueuePlayer.h"
#include "roles/ApplicationRegistry.h"
#include "roles/MediaItem.h"

namespace tarn {

namespace {

RemoteCommandResult resultOf(bool done) {
    return done ? RemoteCommandResult::success : RemoteCommandResult::commandFailed;
}

} // namespace

void VLTorviAudioFileQueuePlayer::_registerTelecueSupportedCommands() {
    using Self = VLTorviAudioFileQueuePlayer;
    RemoteCommandCenter& center = platform_.remoteCommands;
    remoteCommandTargets_.push_back(addTarget(center.pauseCommand(), &Self::_handlePauseCommand));
    remoteCommandTargets_.push_back(addTarget(center.playCommand(), &Self::_handlePlayCommand));
    remoteCommandTargets_.push_back(
        addTarget(center.togglePlayPauseCommand(), &Self::_handleTogglePlayPauseCommand));
    remoteCommandTargets_.push_back(addTarget(center.nextTrackCommand(), &Self::_handleNextTrackCommand));
    center.previousTrackCommand().setEnabled(false);
    remoteCommandTargets_.push_back(center.addPlayer(weak_from_this()));
    playbackChanges_ =
        platform_.notifications.addObserver(MediaQueuePlayer::playbackDidChange, queuePlayer_.get(),
                                            [weakSelf = weak_from_this()](const Notification&) {
                                                if (auto self = weakSelf.lock())
                                                    self->platform_.remoteCommands.playbackChanged(*self);
                                            });
}

RegistrationHandle
VLTorviAudioFileQueuePlayer::addTarget(RemoteCommand& command,
                                       RemoteCommandResult (VLTorviAudioFileQueuePlayer::*handler)()) {
    return command.addTarget(*this, [weakSelf = weak_from_this(), handler] {
        auto self = weakSelf.lock();
        return self ? (self.get()->*handler)() : RemoteCommandResult::commandFailed;
    });
}

RemoteCommandResult VLTorviAudioFileQueuePlayer::_handlePauseCommand() { return resultOf(pause()); }

RemoteCommandResult VLTorviAudioFileQueuePlayer::_handlePlayCommand() { return resultOf(play()); }

RemoteCommandResult VLTorviAudioFileQueuePlayer::_handleTogglePlayPauseCommand() {
    return resultOf(togglePlayPause());
}

RemoteCommandResult VLTorviAudioFileQueuePlayer::_handleNextTrackCommand() {
    queuePlayer_->advanceToNextItem();
    return queuePlayer_->currentItem() ? RemoteCommandResult::success : RemoteCommandResult::noSuchContent;
}

/// Every command that is answered can be answered for every item.
void VLTorviAudioFileQueuePlayer::_updateTelecueSupportedCommandsForCurrentItem() {}

void VLTorviAudioFileQueuePlayer::_updateTelecueForCurrentItem() {
    _updateTelecueSupportedCommandsForCurrentItem();
    _updateTelecueNowPlayingInfoForCurrentItem();
}

/// Rate and item may change on two threads at once. Who comes in between leaves the publication to the one
/// that is at it, so that what is published last is never out of date.
void VLTorviAudioFileQueuePlayer::_updateTelecueNowPlayingInfoForCurrentItem() {
    if (nowPlayingUpdates_++ > 0)
        return;
    do {
        publishNowPlayingInfo();
        platform_.remoteCommands.playerChanged(*this);
    } while (--nowPlayingUpdates_ > 0);
}

void VLTorviAudioFileQueuePlayer::publishNowPlayingInfo() {
    auto item = queuePlayer_->currentItem();
    NowPlayingInfo info = item ? nowPlayingInfo(*item) : NowPlayingInfo{};

    // npos + 1 is 0: without a comma the identifier is taken whole.
    std::string extension = identifier_.substr(identifier_.rfind(',') + 1);
    NowPlayingService& service = platform_.nowPlaying;
    service.setParentApplication(service.localOrigin(),
                                 platform_.applications.applicationContainingExtension(extension));
    service.setNowPlayingInfo(service.localOrigin(), info, NowPlayingService::mergePolicyReplace);
}

/// An item whose record is gone, or whose record has no title, goes by the name of its file.
NowPlayingInfo VLTorviAudioFileQueuePlayer::nowPlayingInfo(const MediaItem& item) const {
    const MediaAsset& asset = *item.asset();
    auto record = assetManager_ ? assetManager_->vlAssetWithAsset(&asset) : nullptr;
    NowPlayingInfo info;
    info.title = record && record->title ? *record->title : fileNameOfURL(asset.URL());
    info.duration = asset.duration().seconds();
    info.elapsedTime = queuePlayer_->currentTime().seconds();
    info.playbackRate = queuePlayer_->rate();
    if (record) {
        info.artist = record->artist;
        info.albumTitle = record->albumTitle;
    }
    return info;
}

} // namespace tarn
