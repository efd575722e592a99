#pragma once

#include <memory>
#include <optional>
#include <string>

#include "objects/ObjectManager.h"
#include "objects/ObjectRegistry.h"
#include "objects/PlayerItem.h"
#include "proto/AudioFilePlayerItem.h"
#include "roles/MediaItem.h"

namespace tarn {

class VLTorviAudioFilePlayerAssetManager;

/// Owns the player items of the client: makes them from assets, tells and moves their position.
///
/// Commands run on the player-item queue; lookups and links may be used from any thread.
class VLTorviAudioFilePlayerItemManager final : public VLTorviAudioFilePlayerObjectManager {
public:
    explicit VLTorviAudioFilePlayerItemManager(const Platform& platform);

    /// Null until the router has one.
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager() const;
    void setAssetManager(std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager);

    /// Serves the first command that the message holds.
    void handleMessage(const std::shared_ptr<VLProtoAudioFilePlayerItem>& message, Reply reply);

    /// The item's first status is pushed to the client before the reply. An item that had the identifier
    /// reports no more; a queue player that holds its media item keeps it.
    void upsertItemWithIdentifier(const std::string& identifier, std::shared_ptr<MediaAsset> asset,
                                  Reply reply);

    void destroyPlayerItemWithIdentifier(const std::string& identifier);

    /// Null when there is none, or no identifier.
    std::shared_ptr<MediaItem> playerItemWithIdentifier(const std::optional<std::string>& identifier) const;

    /// None when no wrapper stands for this very item; also for null.
    std::optional<std::string> identifierForPlayerItem(const MediaItem* playerItem) const;

private:
    void _serveUpsert(const VLProtoAudioFilePlayerUpdateContainedIdentifier& payload, Reply reply);
    void _serveDestroy(const VLProtoObjectMessage& payload, Reply reply);
    void _serveGetCurrentTime(const VLProtoObjectMessage& payload, Reply reply);
    void _serveSetItemCurrentTime(const VLProtoAudioFilePlayerItemSetCurrentTime& payload, Reply reply);

    MutexProtected<std::shared_ptr<VLTorviAudioFilePlayerAssetManager>> assetManager_;
    ObjectRegistry<VLTorviAudioFilePlayerItem> identifierToObjectMap_;
};

} // namespace tarn
