#include "objects/AssetManager.h"

#include <utility>

#include "log/SystemLog.h"
#include "objects/CommandTable.h"
#include "objects/FileName.h"
#include "proto/AudioFilePlayerAssetUpdateMetaData.h"
#include "proto/ObjectMessage.h"
#include "reply/Error.h"
#include "roles/MediaEngine.h"
#include "roles/SandboxExtension.h"
#include "threads/BlockingSection.h"

namespace tarn {

namespace {

constexpr char upsertMethod[] = "-[VLTorviAudioFilePlayerAssetManager upsertAssetWithIdentifer:URL:title:"
                                "albumTitle:artist:sandboxExtensionToken:reply:]";

std::size_t sizeOf(const std::optional<std::string>& text) { return text ? text->size() : 0; }

bool isFilled(const std::optional<std::string>& text) { return text && !text->empty(); }

/// The value of the file's first tag of that key; `otherwise` when it has no such tag.
std::optional<std::string> tagOfFile(const MediaAsset& asset, std::string_view key,
                                     const std::optional<std::string>& otherwise) {
    auto tags = MediaMetadataItem::metadataItemsFromArray(asset.commonMetadata(), key,
                                                          MediaMetadataItem::commonKeySpace);
    return tags.empty() ? otherwise : tags.front().stringValue();
}

MediaAssetOutcome openedAsset(MediaEngine& media, const std::string& URL) {
    BlockingSection mayTakeSeconds;
    return media.openAsset(URL);
}

/// Why a file did not open, for the client.
std::string reasonOf(const Error& error) {
    const std::string text = textsOf(error);
    return text.empty() ? describe(error) : text;
}

} // namespace

VLTorviAudioFilePlayerAssetManager::VLTorviAudioFilePlayerAssetManager(const Platform& platform)
    : VLTorviAudioFilePlayerObjectManager(platform, "VLTorviAudioFilePlayerAssetManager") {}

void VLTorviAudioFilePlayerAssetManager::handleMessage(
    const std::shared_ptr<VLProtoAudioFilePlayerAsset>& message, Reply reply) {
    using Message = VLProtoAudioFilePlayerAsset;
    using Manager = VLTorviAudioFilePlayerAssetManager;
    static constexpr std::tuple commands{
        Command{&Message::upsertWithMetaData, &Manager::_serveUpsert},
        Command{&Message::destroy, &Manager::_serveDestroy},
    };
    serveFirstCommand(commands, *this, *message, std::move(reply));
}

void VLTorviAudioFilePlayerAssetManager::_serveUpsert(
    const VLProtoAudioFilePlayerAssetUpdateMetaData& payload, Reply reply) {
    if (requireIdentifier(payload.identifier(), "upsertWithMetaData", reply))
        upsertAssetWithIdentifer(*payload.identifier(), payload.uRL(), payload.title(), payload.albumTitle(),
                                 payload.artist(), payload.sandboxExtensionToken(), std::move(reply));
}

void VLTorviAudioFilePlayerAssetManager::_serveDestroy(const VLProtoObjectMessage& payload, Reply) {
    if (requireIdentifier(payload.identifier(), "destroy"))
        destroyAssetWithIdentifer(*payload.identifier());
}

void VLTorviAudioFilePlayerAssetManager::upsertAssetWithIdentifer(
    const std::string& identifier, const std::optional<std::string>& URL,
    const std::optional<std::string>& title, const std::optional<std::string>& albumTitle,
    const std::optional<std::string>& artist, const std::optional<std::string>& sandboxExtensionToken,
    Reply reply) {
    Texts texts{title, albumTitle, artist};
    auto charged = charge(ObjectAccount::ofAsset + 2 * identifier.size() + sizeOf(URL) + sizeOf(title) +
                              sizeOf(albumTitle) + sizeOf(artist),
                          "upsertWithMetaData", reply);
    if (!charged)
        return;
    if (!URL) {
        _updateRecord(identifier, texts, *std::move(charged));
        reply.nothing();
        return;
    }

    std::shared_ptr<MediaAsset> asset = _openAsset(*URL, sandboxExtensionToken, reply);
    if (!asset)
        return;
    completeFromFile(texts, *asset, *URL);
    auto record = std::make_shared<VLTorviAudioFilePlayerAsset>();
    record->asset = asset;
    applyTexts(texts, *record);
    identifierToObjectMap_.setObject(identifier, record, *std::move(charged));

    VLProtoAudioFilePlayerAssetUpdateMetaData answer;
    answer.setIdentifier(identifier);
    answer.setTitle(record->title);
    answer.setAlbumTitle(record->albumTitle);
    answer.setArtist(record->artist);
    answer.setDuration(asset->duration().seconds());
    reply.data(answer.serialize());
}

void VLTorviAudioFilePlayerAssetManager::destroyAssetWithIdentifer(const std::string& identifier) {
    identifierToObjectMap_.removeObject(identifier);
}

std::shared_ptr<MediaAsset>
VLTorviAudioFilePlayerAssetManager::assetWithIdentifier(const std::optional<std::string>& identifier) const {
    auto record = identifierToObjectMap_.objectWithIdentifier(identifier);
    return record ? record->asset : nullptr;
}

std::shared_ptr<const VLTorviAudioFilePlayerAsset>
VLTorviAudioFilePlayerAssetManager::vlAssetWithAsset(const MediaAsset* asset) const {
    return identifierToObjectMap_.objectForMediaObject(asset);
}

/// Null when the file did not open; the failure has been logged and answered then.
std::shared_ptr<MediaAsset>
VLTorviAudioFilePlayerAssetManager::_openAsset(const std::string& URL,
                                               const std::optional<std::string>& token, Reply& reply) {
    // The right to open the file is held for no longer than the opening; the asset keeps the file itself.
    std::optional<std::int64_t> handle = _consumeToken(token, URL);
    MediaAssetOutcome outcome = openedAsset(platform().media, URL);
    if (handle)
        platform().sandboxExtensions.release(*handle);
    if (!outcome.asset) {
        SystemLog::error(
            upsertMethod, __LINE__,
            "%{public}s:%d: Could not open audio file asset (Path: %@) due to error: %{public}@.", URL,
            describe(outcome.error));
        reply.error(
            VLError::errorWithCode(platform().localization, VLError::audioPlayback, reasonOf(outcome.error)));
    }
    return outcome.asset;
}

/// The handle of the right that the token gives; none without a token, or when it is not good (any more).
std::optional<std::int64_t>
VLTorviAudioFilePlayerAssetManager::_consumeToken(const std::optional<std::string>& token,
                                                  const std::string& URL) {
    if (!isFilled(token))
        return std::nullopt;
    std::int64_t handle = platform().sandboxExtensions.consume(token->c_str());
    if (handle >= 0)
        return handle;
    SystemLog::error(
        upsertMethod, __LINE__,
        "%{public}s:%d: Failed to consume asset sandox extension (Path: %@). Playback will fail.", URL);
    return std::nullopt;
}

void VLTorviAudioFilePlayerAssetManager::_updateRecord(const std::string& identifier, const Texts& texts,
                                                       ObjectAccount::Charge charge) {
    auto current = identifierToObjectMap_.objectWithIdentifier(identifier);
    if (!current)
        return;
    auto updated = std::make_shared<VLTorviAudioFilePlayerAsset>(*current);
    applyTexts(texts, *updated);
    identifierToObjectMap_.setObject(identifier, std::move(updated), std::move(charge));
}

void VLTorviAudioFilePlayerAssetManager::completeFromFile(Texts& texts, const MediaAsset& asset,
                                                          const std::string& URL) {
    // A title that is given but empty is the client's will; an empty album or artist is not.
    if (!texts.title) {
        auto tags = MediaMetadataItem::metadataItemsFromArray(
            asset.commonMetadata(), MediaMetadataItem::commonKeyTitle, MediaMetadataItem::commonKeySpace);
        if (tags.empty()) {
            texts.title = fileNameOfURL(URL);
            SystemLog::message(upsertMethod, __LINE__,
                               "%{public}s:%d: No metadata for title. Using file name for audio file asset: "
                               "%{public}@",
                               *texts.title);
        } else {
            texts.title = tags.front().stringValue();
            SystemLog::message(upsertMethod, __LINE__,
                               "%{public}s:%d: Decoded title for audio file asset: %{public}@", texts.title);
        }
    }
    if (!isFilled(texts.albumTitle))
        texts.albumTitle = tagOfFile(asset, MediaMetadataItem::commonKeyAlbumName, texts.albumTitle);
    if (!isFilled(texts.artist))
        texts.artist = tagOfFile(asset, MediaMetadataItem::commonKeyArtist, texts.artist);
}

/// An absent or empty text never clears one.
void VLTorviAudioFilePlayerAssetManager::applyTexts(const Texts& texts, VLTorviAudioFilePlayerAsset& record) {
    if (isFilled(texts.title))
        record.title = texts.title;
    if (isFilled(texts.albumTitle))
        record.albumTitle = texts.albumTitle;
    if (isFilled(texts.artist))
        record.artist = texts.artist;
}

} // namespace tarn
