#include "client/tool/Command.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "client/tool/display/OutputLine.h"
#include "proto/VelmoMessage.h"
#include "wire/PropertyList.h"

namespace tarn::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

TEST(EncodeCommand, PutsFieldsOfEveryKindIntoTheEnvelope) {
    const auto upsert = VLProtoVelmoMessage::fromData(encodeCommand(
        {"asset.upsertWithMetaData", "identifier=a", "URL=file:///x=y", "duration=1.5", "title="}));
    ASSERT_TRUE(upsert);
    const auto& asset = upsert->audioFilePlayerMessage()->asset()->upsertWithMetaData();
    EXPECT_EQ(asset->identifier(), "a");
    EXPECT_EQ(asset->uRL(), "file:///x=y");
    EXPECT_EQ(asset->duration(), 1.5);
    EXPECT_EQ(asset->title(), "");
    EXPECT_FALSE(asset->hasArtist());

    const auto items =
        VLProtoVelmoMessage::fromData(encodeCommand({"queuePlayer.upsertWithItems", "identifier=q",
                                                     "playerItemIdentifiers=a", "playerItemIdentifiers=b"}));
    EXPECT_EQ(
        items->audioFilePlayerMessage()->queuePlayer()->upsertWithItems()->playerItemIdentifiersAtIndex(1),
        "b");

    const auto status =
        VLProtoVelmoMessage::fromData(encodeCommand({"playerItem.setStatus", "status=-2", "errorDict=00fF"}));
    EXPECT_EQ(status->audioFilePlayerMessage()->playerItem()->setStatus()->status(), -2);
    EXPECT_EQ(status->audioFilePlayerMessage()->playerItem()->setStatus()->errorDict(), (Data{0, 0xFF}));

    const auto rate = VLProtoVelmoMessage::fromData(encodeCommand({"queuePlayer.setRate", "rate=-0.5"}));
    EXPECT_EQ(rate->audioFilePlayerMessage()->queuePlayer()->setRate()->rate(), -0.5F);
}

TEST(EncodeCommand, SaysWhatItDoesNotKnow) {
    for (const auto& words : std::vector<std::vector<std::string>>{{},
                                                                   {"play"},
                                                                   {"asset.destroy", "id=x"},
                                                                   {"asset.destroy", "identifier"},
                                                                   {"queuePlayer.setRate", "rate=fast"},
                                                                   {"queuePlayer.setRate", "rate=1x"},
                                                                   {"playerItem.setStatus", "errorDict=xy"}})
        EXPECT_THROW(encodeCommand(words), std::invalid_argument);
}

TEST(DecodeEnvelope, NamesTheEventAndShowsAnErrorsTexts) {
    std::string digits;
    const auto texts = *binaryPropertyList({{"Key", "text"}}).data;
    for (const unsigned byte : texts)
        digits.append({"0123456789abcdef"[byte >> 4U], "0123456789abcdef"[byte & 0xFU]});
    const auto event = decodeEnvelope(
        encodeCommand({"queuePlayer.setStatus", "identifier=q", "status=2", "errorDict=" + digits}));
    EXPECT_EQ(event.name, "queuePlayer.setStatus");
    EXPECT_EQ(outputLine(LineFormat::text, "event", event.fields),
              R"(event errorDict={Key="text"} identifier="q" status=2)");
    EXPECT_EQ(decodeEnvelope({0xFF}).name, "");
    EXPECT_EQ(decodeEnvelope({}).name, "");
}

TEST(SplitLine, KnowsQuotesAndBackslashesAsAShellDoes) {
    EXPECT_THAT(splitLine("  a  b\t"), ElementsAre("a", "b"));
    EXPECT_THAT(splitLine(R"(title="A \"b\" c" 'x \y'z a\ b "")"),
                ElementsAre(R"(title=A "b" c)", R"(x \yz)", "a b", ""));
    EXPECT_THROW(splitLine("title='open"), std::invalid_argument);
}

} // namespace
} // namespace tarn::tool
