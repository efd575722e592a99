#pragma once

#include <atomic>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "objects/KeyValueObserverHelper.h"
#include "reply/EventSink.h"
#include "roles/ControllablePlayer.h"
#include "roles/MediaQueuePlayer.h"
#include "roles/NotificationCenter.h"
#include "roles/NowPlayingService.h"
#include "roles/Platform.h"
#include "roles/Registration.h"
#include "roles/RemoteCommandCenter.h"
#include "threads/LiveObjects.h"

namespace tarn {

class MediaItem;
class VLProtoVelmoMessage;
class VLTorviAudioFilePlayerAssetManager;
class VLTorviAudioFilePlayerItemManager;

/// A queue player of the client: plays one media queue player, reports its status, rate and current item to
/// the client, answers the system's media controls and tells them what plays.
///
/// Owned by the queue-player manager's registry, and by a pending activation of the audio session. Client
/// commands arrive on the queue-player queue, media controls on the remote-command thread; reports run on
/// whatever thread the change happens on, and one of them may drop the last reference. Media controls, now
/// playing and their private operations are in QueuePlayerTelecue.cpp.
class VLTorviAudioFileQueuePlayer final : public ControllablePlayer,
                                          public std::enable_shared_from_this<VLTorviAudioFileQueuePlayer> {
public:
    /// Reports status, rate and current item, in this order, before it returns. The last component of the
    /// comma-separated `identifier` names the client's app extension. `audioServer` and the managers may be
    /// null: what needs them is left out.
    static std::shared_ptr<VLTorviAudioFileQueuePlayer>
    initWithQueuePlayer(const Platform& platform, std::shared_ptr<MediaQueuePlayer> queuePlayer,
                        std::string identifier, std::shared_ptr<EventSink> audioServer,
                        std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager,
                        std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager);

    /// The client is gone: there is nothing to play any more and nobody to tell, though a command or an
    /// activation may still hold the player. Once.
    void close();

    /// setRate(1).
    bool play();

    /// False when there is no current item; nothing is done then.
    bool pause();

    bool isPlaying() const;
    bool togglePlayPause();

    /// Pauses when `rate` counts as zero. Otherwise activates the audio session, waiting for it for up to 17
    /// seconds, and applies the rate exactly. False when the activation failed or took longer; a late success
    /// still applies the rate.
    bool setRate(float rate) override;

    PlaybackState playback() const override { return queuePlayer_->playback(); }

    const std::string& identifier() const { return identifier_; }
    const std::shared_ptr<MediaQueuePlayer>& queuePlayer() const { return queuePlayer_; }
    const std::shared_ptr<EventSink>& audioServer() const { return audioServer_; }
    const std::shared_ptr<VLTorviAudioFilePlayerItemManager>& playerItemManager() const {
        return playerItemManager_;
    }
    const std::shared_ptr<VLTorviAudioFilePlayerAssetManager>& assetManager() const { return assetManager_; }

    const void* mediaObject() const { return queuePlayer_.get(); }

private:
    struct Activation;

    VLTorviAudioFileQueuePlayer(const Platform& platform, std::shared_ptr<MediaQueuePlayer> queuePlayer,
                                std::string identifier, std::shared_ptr<EventSink> audioServer,
                                std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager,
                                std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager);

    void startObserving();
    std::unique_ptr<VLTorviKeyValueObserverHelper> observe(std::string_view keyPath,
                                                           void (VLTorviAudioFileQueuePlayer::*report)());
    void _reportStatus();
    void _reportRate();
    void _reportCurrentItem();
    void send(const VLProtoVelmoMessage& envelope);

    void _registerForAudioSessionNotifications();
    void _handleInterruptionNotification(const Notification& notification);

    void _registerTelecueSupportedCommands();
    RegistrationHandle addTarget(RemoteCommand& command,
                                 RemoteCommandResult (VLTorviAudioFileQueuePlayer::*handler)());
    RemoteCommandResult _handlePauseCommand();
    RemoteCommandResult _handlePlayCommand();
    RemoteCommandResult _handleTogglePlayPauseCommand();
    RemoteCommandResult _handleNextTrackCommand();
    void _updateTelecueSupportedCommandsForCurrentItem();
    void _updateTelecueForCurrentItem();
    void _updateTelecueNowPlayingInfoForCurrentItem();
    void publishNowPlayingInfo();
    NowPlayingInfo nowPlayingInfo(const MediaItem& item) const;

    // Released from the last to the first: everything that calls in ends while what it reads is still held.
    const Platform platform_;
    const std::string identifier_;
    const std::shared_ptr<MediaQueuePlayer> queuePlayer_;
    const std::shared_ptr<EventSink> audioServer_;
    std::unique_ptr<VLTorviKeyValueObserverHelper> statusObserver_;
    std::unique_ptr<VLTorviKeyValueObserverHelper> rateObserver_;
    std::unique_ptr<VLTorviKeyValueObserverHelper> currentItemObserver_;
    const std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager_;
    const std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager_;
    RegistrationHandle interruptions_;
    RegistrationHandle playbackChanges_;
    std::vector<RegistrationHandle> remoteCommandTargets_;
    std::atomic<int> nowPlayingUpdates_{0}; // asked for and not made yet
    LiveObject<"queue player"> live_;
};

} // namespace tarn
