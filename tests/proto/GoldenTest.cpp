// Bytes that other implementations rely on.

#include <algorithm>
#include <functional>

#include <gtest/gtest.h>

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "tests/proto/Hex.h"

namespace tarn {

namespace {

using Maker = std::function<std::shared_ptr<ProtoCodable>()>;
using Decoder = std::function<std::shared_ptr<ProtoCodable>(const Data&)>;

struct Golden {
    const char* name;
    Maker make;
    const char* hex;
    Decoder decode;
};

template <class Message>
Golden golden(const char* name, const char* hex, std::function<void(Message&)> fill) {
    return {name,
            [fill] {
                auto message = std::make_shared<Message>();
                fill(*message);
                return message;
            },
            hex, [](const Data& data) { return Message::fromData(data); }};
}

Golden goldenEnvelope(const char* name, const char* hex, std::function<Envelope()> make) {
    return {name, std::move(make), hex, [](const Data& data) { return VLProtoVelmoMessage::fromData(data); }};
}

template <class Message = VLProtoObjectMessage>
std::shared_ptr<Message> named(const char* identifier) {
    auto message = std::make_shared<Message>();
    message->setIdentifier(identifier);
    return message;
}

const Golden goldens[] = {
    golden<VLProtoVelmoMessage>("an empty envelope", "", [](auto&) {}),
    goldenEnvelope("an item played to its end", "12 07 12 05 32 03 0A 01 61",
                   [] { return velmoMessageForPlayerItemNotifyDidPlayToEndTime(named("a")); }),
    goldenEnvelope("no current item any more", "12 07 1A 05 52 03 0A 01 71",
                   [] {
                       return velmoMessageForQueuePlayerSetCurrentItem(
                           named<VLProtoAudioFilePlayerUpdateContainedIdentifier>("q"));
                   }),
    golden<VLProtoObjectMessage>("a required text that was never set", "0A 00", [](auto&) {}),
    golden<VLProtoAudioFilePlayerStatus>("ready to play", "0A 01 61 10 01",
                                         [](auto& message) {
                                             message.setIdentifier("a");
                                             message.setStatus(1);
                                         }),
    golden<VLProtoAudioFilePlayerStatus>("failed", "10 02 1A 01 64 20 FF FF FF FF FF FF FF FF FF 01",
                                         [](auto& message) {
                                             message.setStatus(2);
                                             message.setErrorDomain("d");
                                             message.setErrorCode(-1);
                                         }),
    golden<VLProtoAudioFilePlayerStatus>("a scalar set to zero", "10 00",
                                         [](auto& message) { message.setStatus(0); }),
    golden<VLProtoAudioFileQueuePlayerSetRate>("play at normal rate", "0A 01 61 15 00 00 80 3F",
                                               [](auto& message) {
                                                   message.setIdentifier("a");
                                                   message.setRate(1);
                                               }),
    golden<VLProtoAudioFileQueuePlayerSetRate>("a required scalar that was never set", "0A 00 15 00 00 00 00",
                                               [](auto&) {}),
    golden<VLProtoAudioFilePlayerCurrentTime>("a time", "09 00 00 00 00 00 00 F8 3F",
                                              [](auto& message) { message.setCurrentTime(1.5); }),
    golden<VLProtoAudioFileQueuePlayerSetItems>("two items", "0A 01 71 12 01 61 12 01 62",
                                                [](auto& message) {
                                                    message.setIdentifier("q");
                                                    message.addPlayerItemIdentifiers("a");
                                                    message.addPlayerItemIdentifiers("b");
                                                }),
    golden<VLProtoAudioFileQueuePlayer>(
        "fields in the order of their numbers", "12 02 0A 00 1A 07 0A 00 15 00 00 00 00",
        [](auto& message) {
            message.setSetRate(std::make_shared<VLProtoAudioFileQueuePlayerSetRate>());
            message.setDestroy(std::make_shared<VLProtoObjectMessage>());
        }),
    golden<VLProtoVelmoObject>("a value of which only the type is known", "08 FF FF FF FF FF FF FF FF FF 01",
                               [](auto& message) { message.setType(-1); }),
    golden<VLProtoVelmoObject>(
        "a value with everything",
        "08 01 10 02 22 01 6B 2A 01 74 31 00 00 00 00 00 00 04 40 3D 00 00 00 3F 40 05 48 06 "
        "50 FF FF FF FF FF FF FF FF FF 01 58 FF FF FF FF 0F 60 01 6A 01 00",
        [](auto& message) {
            message.setType(1);
            message.setSubtype(2);
            message.setKey("k");
            message.setText("t");
            message.setNdouble(2.5);
            message.setNfloat(0.5F);
            message.setNint64(5);
            message.setNint32(6);
            message.setNuint64(UINT64_MAX);
            message.setNuint32(UINT32_MAX);
            message.setNbool(true);
            message.setObject(Data{0});
            message.setCacheMessage(std::make_shared<int>(1)); // never on the wire
        }),
    golden<VLProtoVelmoPlist>("two values", "0A 02 08 01 0A 02 08 02",
                              [](auto& message) {
                                  for (const int type : {1, 2}) {
                                      message.addObject(std::make_shared<VLProtoVelmoObject>());
                                      message.objects()->back()->setType(type);
                                  }
                              }),
};

class GoldenBytes : public testing::TestWithParam<Golden> {};

TEST_P(GoldenBytes, AreWrittenAndReadBack) {
    const auto message = GetParam().make();
    EXPECT_EQ(message->serialize(), bytesFromHex(GetParam().hex));
    const auto decoded = GetParam().decode(bytesFromHex(GetParam().hex));
    ASSERT_TRUE(decoded);
    EXPECT_EQ(decoded->serialize(), bytesFromHex(GetParam().hex));
}

std::string testName(const testing::TestParamInfo<Golden>& parameter) {
    std::string name = parameter.param.name;
    std::ranges::replace(name, ' ', '_');
    return name;
}

INSTANTIATE_TEST_SUITE_P(Messages, GoldenBytes, testing::ValuesIn(goldens), testName);

} // namespace

} // namespace tarn
