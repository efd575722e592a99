#include "client/libtarn/Decoding.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "client/libtarn/ErrorTexts.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "wire/PropertyList.h"

namespace tarn {
namespace {

using testing::IsEmpty;

TEST(ErrorTexts, AreReadBackFromThePropertyListThatTheServiceWrites) {
    const std::map<std::string, std::string> texts = {{localizedDescriptionKey, "Plain text"},
                                                      {localizedFailureReasonKey, "Überschall, 音楽, 🎵"},
                                                      {"long", std::string(70'000, 'x')},
                                                      {"empty", ""}};
    EXPECT_EQ(readErrorTexts(*binaryPropertyList(texts).data), texts);
    EXPECT_THAT(readErrorTexts(*binaryPropertyList({}).data), IsEmpty());
}

TEST(ErrorTexts, SurviveEveryByteBeingWrong) {
    const auto good = *binaryPropertyList({{"key", "value"}, {"clé", "naïve"}}).data;
    for (std::size_t i = 0; i < good.size(); ++i) {
        for (const int value : {0, 1, 0x0F, 0x5F, 0x6F, 0x7F, 0xDF, 0xFF}) {
            Data bad = good;
            bad[i] = static_cast<std::uint8_t>(value);
            readErrorTexts(bad);
        }
        EXPECT_THAT(readErrorTexts(std::span(good).first(i)), IsEmpty());
    }
}

std::shared_ptr<VLProtoAudioFilePlayerStatus> failedStatus() {
    auto status = std::make_shared<VLProtoAudioFilePlayerStatus>();
    status->setIdentifier("a");
    status->setStatus(2);
    status->setErrorDomain("domain");
    status->setErrorCode(-7);
    status->setErrorDict(binaryPropertyList({{localizedDescriptionKey, "No file."}}).data);
    return status;
}

template <class Kind>
Kind decoded(const Envelope& envelope) {
    const auto event = decodeEvent(envelope->serialize());
    return event && std::holds_alternative<Kind>(*event) ? std::get<Kind>(*event) : Kind();
}

TEST(Events, AreToldApartAndCarryWhatTheyMean) {
    auto object = std::make_shared<VLProtoObjectMessage>();
    object->setIdentifier("a");
    auto pair = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    pair->setIdentifier("a");
    auto rate = std::make_shared<VLProtoAudioFileQueuePlayerSetRate>();
    rate->setIdentifier("a");
    rate->setRate(-1.5F);

    EXPECT_EQ(decoded<client::ItemTimeJumped>(velmoMessageForPlayerItemNotifyTimeJumped(object)).item, "a");
    EXPECT_EQ(decoded<client::ItemPlayedToEnd>(velmoMessageForPlayerItemNotifyDidPlayToEndTime(object)).item,
              "a");
    EXPECT_EQ(
        decoded<client::ItemFailedToPlayToEnd>(velmoMessageForPlayerItemNotifyFailedToPlayToEndTime(object))
            .item,
        "a");
    EXPECT_EQ(decoded<client::PlayerRateChanged>(velmoMessage(rate)).rate, -1.5F);
    EXPECT_EQ(
        decoded<client::PlayerStatusChanged>(velmoMessageForQueuePlayerSetStatus(failedStatus())).player,
        "a");
    EXPECT_EQ(decoded<client::CurrentItemChanged>(velmoMessageForQueuePlayerSetCurrentItem(pair)).player,
              "a");
    EXPECT_FALSE(decoded<client::CurrentItemChanged>(velmoMessageForQueuePlayerSetCurrentItem(pair)).item);

    const auto status =
        decoded<client::ItemStatusChanged>(velmoMessageForPlayerItemSetStatus(failedStatus())).status;
    EXPECT_EQ(status.value, client::Status::Value::failed);
    ASSERT_TRUE(status.error);
    EXPECT_EQ(status.error->domain, "domain");
    EXPECT_EQ(status.error->code, -7);
    EXPECT_EQ(status.error->description(), "No file.");

    EXPECT_FALSE(decodeEvent({}));
    EXPECT_FALSE(decodeEvent({0xFF}));
    EXPECT_FALSE(decodeEvent(velmoMessageForAssetDestroy(object)->serialize())) << "a command, not an event";
}

} // namespace
} // namespace tarn
