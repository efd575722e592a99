#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "objects/Asset.h"
#include "objects/ObjectManager.h"
#include "objects/ObjectRegistry.h"
#include "proto/AudioFilePlayerAsset.h"

namespace tarn {

/// Owns the assets of the client: opens its files, completes what the client left out of title, album and
/// artist from the file, and answers with the result.
///
/// Commands run on the queue-player queue; opening a file may block it for seconds. Lookups may be called
/// from any thread.
class VLTorviAudioFilePlayerAssetManager final : public VLTorviAudioFilePlayerObjectManager {
public:
    explicit VLTorviAudioFilePlayerAssetManager(const Platform& platform);

    /// Serves the first command that the message holds.
    void handleMessage(const std::shared_ptr<VLProtoAudioFilePlayerAsset>& message, Reply reply);

    /// With a URL: opens the file with the right that the token gives, and stores a new record. Without:
    /// updates the texts of the record that is there.
    void upsertAssetWithIdentifer(const std::string& identifier, const std::optional<std::string>& URL,
                                  const std::optional<std::string>& title,
                                  const std::optional<std::string>& albumTitle,
                                  const std::optional<std::string>& artist,
                                  const std::optional<std::string>& sandboxExtensionToken, Reply reply);

    /// Items made from the asset keep it.
    void destroyAssetWithIdentifer(const std::string& identifier);

    /// Null when there is none.
    std::shared_ptr<MediaAsset> assetWithIdentifier(const std::optional<std::string>& identifier) const;

    /// The record that stands for this very asset; null when there is none.
    std::shared_ptr<const VLTorviAudioFilePlayerAsset> vlAssetWithAsset(const MediaAsset* asset) const;

private:
    struct Texts {
        std::optional<std::string> title;
        std::optional<std::string> albumTitle;
        std::optional<std::string> artist;
    };

    void _serveUpsert(const VLProtoAudioFilePlayerAssetUpdateMetaData& payload, Reply reply);
    void _serveDestroy(const VLProtoObjectMessage& payload, Reply reply);

    std::shared_ptr<MediaAsset> _openAsset(const std::string& URL, const std::optional<std::string>& token,
                                           Reply& reply);
    std::optional<std::int64_t> _consumeToken(const std::optional<std::string>& token,
                                              const std::string& URL);
    void _updateRecord(const std::string& identifier, const Texts& texts, ObjectAccount::Charge charge);

    static void completeFromFile(Texts& texts, const MediaAsset& asset, const std::string& URL);
    static void applyTexts(const Texts& texts, VLTorviAudioFilePlayerAsset& record);

    ObjectRegistry<const VLTorviAudioFilePlayerAsset> identifierToObjectMap_;
};

} // namespace tarn
