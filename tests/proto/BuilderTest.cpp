// Envelopes around payloads, and status messages from media objects.

#include <gtest/gtest.h>

#include "proto/Envelope.h"
#include "proto/ErrorUserInfo.h"
#include "proto/VelmoMessage.h"
#include "roles/MediaItem.h"
#include "roles/MediaQueuePlayer.h"
#include "tests/proto/Hex.h"
#include "tests/support/CapturedLog.h"
#include "wire/PropertyList.h"

namespace tarn {

namespace {

template <class Payload>
std::shared_ptr<Payload> named() {
    auto payload = std::make_shared<Payload>();
    payload->setIdentifier("a");
    return payload;
}

struct Wrapped {
    const char* field; // as in "queuePlayer.setRate"
    Envelope envelope;
};

std::vector<Wrapped> wrappedPayloads() {
    const auto object = named<VLProtoObjectMessage>();
    const auto contained = named<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    const auto status = named<VLProtoAudioFilePlayerStatus>();
    return {
        {"asset.upsertWithMetaData", velmoMessage(named<VLProtoAudioFilePlayerAssetUpdateMetaData>())},
        {"asset.destroy", velmoMessageForAssetDestroy(object)},
        {"playerItem.upsertWithAsset", velmoMessageForPlayerItemUpsertWithAsset(contained)},
        {"playerItem.destroy", velmoMessageForPlayerItemDestroy(object)},
        {"playerItem.setStatus", velmoMessageForPlayerItemSetStatus(status)},
        {"playerItem.getCurrentTime", velmoMessageForPlayerItemGetCurrentTime(object)},
        {"playerItem.notifyTimeJumped", velmoMessageForPlayerItemNotifyTimeJumped(object)},
        {"playerItem.notifyDidPlayToEndTime", velmoMessageForPlayerItemNotifyDidPlayToEndTime(object)},
        {"playerItem.notifyFailedToPlayToEndTime",
         velmoMessageForPlayerItemNotifyFailedToPlayToEndTime(object)},
        {"playerItem.setItemCurrentTime", velmoMessage(named<VLProtoAudioFilePlayerItemSetCurrentTime>())},
        {"queuePlayer.upsertWithItems", velmoMessage(named<VLProtoAudioFileQueuePlayerSetItems>())},
        {"queuePlayer.destroy", velmoMessageForQueuePlayerDestroy(object)},
        {"queuePlayer.setRate", velmoMessage(named<VLProtoAudioFileQueuePlayerSetRate>())},
        {"queuePlayer.replaceCurrentItem", velmoMessageForQueuePlayerReplaceCurrentItem(contained)},
        {"queuePlayer.setStatus", velmoMessageForQueuePlayerSetStatus(status)},
        {"queuePlayer.advanceToNextItem", velmoMessageForQueuePlayerAdvanceToNextItem(object)},
        {"queuePlayer.appendItem", velmoMessageForQueuePlayerAppendItem(contained)},
        {"queuePlayer.removeItem", velmoMessageForQueuePlayerRemoveItem(contained)},
        {"queuePlayer.removeAllItems", velmoMessageForQueuePlayerRemoveAllItems(object)},
        {"queuePlayer.setCurrentItem", velmoMessageForQueuePlayerSetCurrentItem(contained)},
    };
}

/// The one entry of a dictionary of dictionaries; its key is added to `path`.
const Dictionary& onlyEntry(const Dictionary& dictionary, std::string& path) {
    EXPECT_EQ(dictionary.size(), 1U);
    path += (path.empty() ? "" : ".") + dictionary.begin()->first;
    return std::get<Dictionary>(dictionary.begin()->second.value);
}

TEST(Builders, SetOneFieldAtEachLevel) {
    for (const auto& [field, envelope] : wrappedPayloads()) {
        std::string path;
        const Dictionary whole = envelope->dictionaryRepresentation();
        const Dictionary& payload = onlyEntry(onlyEntry(onlyEntry(whole, path), path), path);
        EXPECT_EQ(path, "audioFilePlayerMessage." + std::string(field));
        EXPECT_EQ(payload.at("identifier"), (DictionaryValue{std::string("a")}));
    }
}

TEST(Builders, StoreThePayloadItself) {
    const auto payload = named<VLProtoObjectMessage>();
    const Envelope envelope = velmoMessageForAssetDestroy(payload);
    payload->setIdentifier("b");
    EXPECT_EQ(envelope->audioFilePlayerMessage()->asset()->destroy(), payload);
    EXPECT_FALSE(envelope->hasPlist());
}

/// Reports what it was made with.
class FixedItem final : public MediaItem {
public:
    FixedItem(MediaStatus status, std::optional<Error> error) : status_(status), error_(std::move(error)) {}

    RegistrationHandle observe(std::string_view, Block) override { return nullptr; }
    MediaStatus status() const override { return status_; }
    std::optional<Error> error() const override { return error_; }
    const std::shared_ptr<MediaAsset>& asset() const override { return asset_; }
    MediaTime currentTime() const override { return MediaTime::zero(); }
    void seekToTime(MediaTime) override {}

private:
    MediaStatus status_;
    std::optional<Error> error_;
    std::shared_ptr<MediaAsset> asset_;
};

/// The same, and has no queue.
class FixedPlayer final : public MediaQueuePlayer {
public:
    FixedPlayer(MediaStatus status, std::optional<Error> error) : status_(status), error_(std::move(error)) {}

    RegistrationHandle observe(std::string_view, Block) override { return nullptr; }
    MediaStatus status() const override { return status_; }
    std::optional<Error> error() const override { return error_; }
    void soundFailed(const Error&) override {}
    float rate() const override { return 0; }
    void setRate(float) override {}
    void pause() override {}
    void play() override {}
    std::shared_ptr<MediaItem> currentItem() const override { return nullptr; }
    MediaTime currentTime() const override { return MediaTime::zero(); }
    PlaybackState playback() const override { return {}; }
    void advanceToNextItem() override {}
    void insertItem(std::shared_ptr<MediaItem>, const std::shared_ptr<MediaItem>&) override {}
    void removeItem(const std::shared_ptr<MediaItem>&) override {}
    void removeAllItems() override {}
    void replaceCurrentItem(std::shared_ptr<MediaItem>) override {}
    void setAudioSession(AudioSession&) override {}
    AudioSession* audioSession() const override { return nullptr; }

private:
    MediaStatus status_;
    std::optional<Error> error_;
};

/// Of an item; that of a queue player in the same state is the same.
auto statusOf(MediaStatus status, const std::optional<Error>& error,
              const std::optional<std::string>& identifier = "a") {
    auto ofItem =
        VLProtoAudioFilePlayerStatus::statusMessageFromPlayerItem(FixedItem(status, error), identifier);
    const auto ofPlayer =
        VLProtoAudioFilePlayerStatus::statusMessageFromPlayer(FixedPlayer(status, error), identifier);
    EXPECT_TRUE(ofItem->isEqual(*ofPlayer));
    return ofItem;
}

TEST(StatusMessage, OfWhatIsReadyHasNoError) {
    EXPECT_EQ(statusOf(MediaStatus::readyToPlay, std::nullopt)->serialize(), bytesFromHex("0A 01 61 10 01"));
    EXPECT_EQ(statusOf(MediaStatus::unknown, std::nullopt, std::nullopt)->serialize(), bytesFromHex("10 00"));
}

TEST(StatusMessage, OfWhatFailedCarriesTheTextsForAPersonAndNothingElse) {
    const Error error{
        "d",
        -1,
        {{localizedDescriptionKey, "what"}, {localizedFailureReasonKey, "why"}, {"path", "/secret"}}};
    const auto message = statusOf(MediaStatus::failed, error);
    EXPECT_EQ(message->errorDomain(), "d");
    EXPECT_EQ(message->errorCode(), -1);
    EXPECT_EQ(
        message->errorDict(),
        binaryPropertyList({{localizedDescriptionKey, "what"}, {localizedFailureReasonKey, "why"}}).data);
}

TEST(StatusMessage, WithoutTextsHasNoDictionary) {
    EXPECT_FALSE(statusOf(MediaStatus::failed, Error{"d", 1, {}})->hasErrorDict());
    EXPECT_FALSE(statusOf(MediaStatus::failed, Error{"d", 1, {{"path", "/"}}})->hasErrorDict());
}

TEST(StatusMessage, LosesOnlyTheTextsThatCannotBeSerialized) {
    const CapturedLog log;
    const auto message = statusOf(MediaStatus::failed, Error{"d", 7, {{localizedDescriptionKey, "\xFF"}}});
    EXPECT_EQ(message->errorCode(), 7);
    EXPECT_FALSE(message->hasErrorDict());
    ASSERT_EQ(log.errors().size(), 2U) << "of the item and of the player";
    EXPECT_TRUE(log.errors().front().starts_with(
        "_VLMakeDataFromErrorUserInfo:61: Error serializing audio file player "
        "item status error: "))
        << log.errors().front();
}

} // namespace

} // namespace tarn
