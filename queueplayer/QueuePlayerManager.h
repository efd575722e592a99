#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "objects/ObjectManager.h"
#include "objects/ObjectRegistry.h"
#include "proto/AudioFileQueuePlayer.h"
#include "queueplayer/QueuePlayer.h"

namespace tarn {

class AudioSession;

/// Owns the queue players of the client: makes them from player items, sets their rate and edits their
/// queues.
///
/// Commands run on the queue-player queue; a rate that waits for the audio session holds it for up to 17
/// seconds. Links may be used from any thread. A queue player keeps the managers that it was made with.
class VLTorviAudioFilePlayerQueuePlayerManager final : public VLTorviAudioFilePlayerObjectManager {
public:
    explicit VLTorviAudioFilePlayerQueuePlayerManager(const Platform& platform);

    /// Null until the router has one; then no player item is found.
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager() const;
    void setPlayerItemManager(std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager);

    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager() const;
    void setAssetManager(std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager);

    /// Serves the first command that the message holds, in the order of the table, not of the fields.
    void handleMessage(const std::shared_ptr<VLProtoAudioFileQueuePlayer>& message, Reply reply);

    /// The new player's status, rate and current item are pushed to the client before the reply. A player
    /// that had the identifier is let go, and with it its sound.
    void upsertQueuePlayerWithIdentifier(const std::string& identifier,
                                         std::vector<std::shared_ptr<MediaItem>> playerItems, Reply reply);

    void destroyQueuePlayerWithIdentifier(const std::string& identifier);

    /// The client is gone. Any thread, once: lets every queue player go at once, also from under commands
    /// that wait, and any that these make afterwards; closes what a command or an activation still holds.
    void close();

    /// Null when there is none, or no identifier.
    std::shared_ptr<MediaQueuePlayer>
    queuePlayerWithIdentifier(const std::optional<std::string>& identifier) const;

    /// For long-form playback; a failure costs one log line.
    void setupAudioSession(AudioSession& session);

private:
    using ObjectPayload = VLProtoObjectMessage;
    using ContainedPayload = VLProtoAudioFilePlayerUpdateContainedIdentifier;

    /// A queue player and an item for it, as a command named them; null where it named none that is known.
    struct Edit {
        std::shared_ptr<MediaQueuePlayer> queuePlayer;
        std::shared_ptr<MediaItem> item;

        explicit operator bool() const { return queuePlayer && item; }
    };

    void _serveSetRate(const VLProtoAudioFileQueuePlayerSetRate& payload, Reply reply);
    void _serveUpsert(const VLProtoAudioFileQueuePlayerSetItems& payload, Reply reply);
    void _serveDestroy(const ObjectPayload& payload, Reply reply);
    void _serveAdvanceToNextItem(const ObjectPayload& payload, Reply reply);
    void _serveAppendItem(const ContainedPayload& payload, Reply reply);
    void _serveRemoveItem(const ContainedPayload& payload, Reply reply);
    void _serveRemoveAllItems(const ObjectPayload& payload, Reply reply);
    void _serveReplaceCurrentItem(const ContainedPayload& payload, Reply reply);

    Edit editOf(const ContainedPayload& payload, std::string_view command, Reply& reply);
    std::shared_ptr<MediaItem> playerItemWithIdentifier(const std::optional<std::string>& identifier) const;

    MutexProtected<std::shared_ptr<VLTorviAudioFilePlayerItemManager>> playerItemManager_;
    MutexProtected<std::shared_ptr<VLTorviAudioFilePlayerAssetManager>> assetManager_;
    ObjectRegistry<VLTorviAudioFileQueuePlayer> identifierToObjectMap_;
    /// Those that live: also what was destroyed or replaced, while a command or an activation holds it.
    MutexProtected<std::vector<std::weak_ptr<VLTorviAudioFileQueuePlayer>>> made_;
};

} // namespace tarn
