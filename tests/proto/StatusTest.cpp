// Status messages from media objects.

#include <gtest/gtest.h>

#include "proto/ErrorUserInfo.h"
#include "proto/VelmoMessage.h"
#include "roles/MediaItem.h"
#include "tests/proto/Hex.h"
#include "tests/support/CapturedLog.h"
#include "wire/PropertyList.h"

namespace tarn {

namespace {

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

auto statusOf(MediaStatus status, const std::optional<Error>& error,
              const std::optional<std::string>& identifier = "a") {
    return VLProtoAudioFilePlayerStatus::statusMessageFromPlayerItem(FixedItem(status, error), identifier);
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

TEST(StatusMessage, LosesOnlyTheTextsThatCannotBeSerialized) {
    const CapturedLog log;
    const auto message = statusOf(MediaStatus::failed, Error{"d", 7, {{localizedDescriptionKey, "\xFF"}}});
    EXPECT_EQ(message->errorCode(), 7);
    EXPECT_FALSE(message->hasErrorDict());
    ASSERT_EQ(log.errors().size(), 1U);
    EXPECT_TRUE(log.errors().front().starts_with(
        "_VLMakeDataFromErrorUserInfo:61: Error serializing audio file player "
        "item status error: "))
        << log.errors().front();
}

} // namespace

} // namespace tarn
