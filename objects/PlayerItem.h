#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "objects/KeyValueObserverHelper.h"
#include "reply/EventSink.h"
#include "roles/MediaItem.h"
#include "roles/NotificationCenter.h"
#include "roles/Registration.h"
#include "threads/LiveObjects.h"

namespace tarn {

class VLProtoObjectMessage;
class VLProtoVelmoMessage;

/// Reports to the client what happens to one media item: its status at once and at every change, that it
/// played to its end, failed to, or jumped in time.
///
/// Owned by the player-item manager's registry; letting it go ends the reports, also when a queue player goes
/// on playing the media item. Reports run on whatever thread the change happens on, and one of them may drop
/// the last reference.
class VLTorviAudioFilePlayerItem final : public std::enable_shared_from_this<VLTorviAudioFilePlayerItem> {
public:
    /// Reports the status before it returns. `audioServer` may be null: nothing is reported then.
    static std::shared_ptr<VLTorviAudioFilePlayerItem>
    initWithPlayerItem(NotificationCenter& notifications, std::shared_ptr<MediaItem> playerItem,
                       std::string identifier, std::shared_ptr<EventSink> audioServer);

    const std::shared_ptr<MediaItem>& playerItem() const { return playerItem_; }
    const std::shared_ptr<EventSink>& audioServer() const { return audioServer_; }
    const std::string& identifier() const { return identifier_; }

    const void* mediaObject() const { return playerItem_.get(); }

private:
    VLTorviAudioFilePlayerItem(std::shared_ptr<MediaItem> playerItem, std::string identifier,
                               std::shared_ptr<EventSink> audioServer);

    void startObserving(NotificationCenter& notifications);
    void handleNotification(std::string_view name);
    void _reportStatus();
    void _playerItemDidReachEnd();
    void _playerItemFailedToReachEnd();
    void _playerItemTimeJumped();
    std::shared_ptr<VLProtoObjectMessage> objectMessage() const;
    void send(const VLProtoVelmoMessage& envelope);

    // Released from the last to the first: the reports end while the media item is still held.
    const std::shared_ptr<MediaItem> playerItem_;
    std::unique_ptr<VLTorviKeyValueObserverHelper> statusObserver_;
    const std::shared_ptr<EventSink> audioServer_;
    const std::string identifier_;
    RegistrationHandle notifications_;
    LiveObject<"player item"> live_;
};

} // namespace tarn
