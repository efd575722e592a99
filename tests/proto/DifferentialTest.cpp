// The same bytes through libprotobuf, and the complete list of where it decides otherwise.

#include <google/protobuf/stubs/logging.h>
#include <gtest/gtest.h>

#include "tests/proto/AllMessages.h"
#include "tests/proto/Generator.h"
#include "tests/proto/Hex.h"
#include "velmo.pb.h"

namespace tarn {

namespace {

std::unique_ptr<google::protobuf::Message> refereeFor(std::string_view className) {
    const auto* descriptor =
        wire::VLProtoVelmoMessage::descriptor()->file()->FindMessageTypeByName(std::string(className));
    return std::unique_ptr<google::protobuf::Message>(
        google::protobuf::MessageFactory::generated_factory()->GetPrototype(descriptor)->New());
}

/// What libprotobuf makes of the bytes, encoded again without what it does not know; none when it refuses.
std::optional<Data> refereed(std::string_view className, const Data& bytes) {
    const google::protobuf::LogSilencer silencer; // it logs texts that are not UTF-8, and keeps them
    const auto message = refereeFor(className);
    if (!message->ParsePartialFromArray(bytes.data(), static_cast<int>(bytes.size())))
        return std::nullopt;
    message->DiscardUnknownFields();
    const std::string encoded = message->SerializePartialAsString();
    return Data(encoded.begin(), encoded.end());
}

template <class Message>
std::optional<Data> ours(const Data& bytes) {
    const auto message = Message::fromData(bytes);
    ProtoReader reader(bytes);
    EXPECT_EQ(Message::pass(reader), message != nullptr);
    return message ? std::optional(message->serialize()) : std::nullopt;
}

class Differential : public testing::TestWithParam<Generator::Style> {};

TEST_P(Differential, AgreesOnGeneratedMessages) {
    Generator generator(17, GetParam());
    AllMessages::forEach([&]<class Message>() {
        for (int count = 0; count < 400; ++count) {
            const Data bytes = generator.encodingOf<Message>();
            ASSERT_EQ(ours<Message>(bytes), refereed(Message::className, bytes)) << Message::className;
        }
    });
}

INSTANTIATE_TEST_SUITE_P(Styles, Differential,
                         testing::Values(Generator::Style::plain, Generator::Style::scrambled));

/// Cut anywhere, both refuse or both accept. What was cut may lack required fields, which only we write as
/// empty, so that only the verdicts are compared.
TEST(DifferentialCut, AgreesOnWhatIsComplete) {
    Generator generator(19, Generator::Style::scrambled);
    AllMessages::forEach([&]<class Message>() {
        for (int count = 0; count < 30; ++count) {
            Data bytes = generator.encodingOf<Message>();
            for (; !bytes.empty(); bytes.pop_back())
                ASSERT_EQ(ours<Message>(bytes).has_value(), refereed(Message::className, bytes).has_value());
        }
    });
}

struct Difference {
    const char* name;
    const char* hex;  // of a VLProtoAudioFilePlayerItem
    const char* ours; // null: refused
    const char* theirs;
};

constexpr const char* refused = nullptr;

const Difference differences[] = {
    {"an end-of-group key ends the message", "12 03 0A 01 61 0C FF", "12 03 0A 01 61", refused},
    {"field 0 is skipped", "00 01 12 03 0A 01 61", "12 03 0A 01 61", refused},
    {"an endless key is field 0", "FF FF FF FF FF FF FF FF FF FF 01 12 03 0A 01 61", "12 03 0A 01 61",
     refused},
    {"the wire type of a known field is not checked", "10 03 0A 01 61", "12 03 0A 01 61", refused},
    {"a second embedded message replaces the first", "1A 03 0A 01 61 1A 02 10 01", "1A 02 10 01",
     "1A 05 0A 01 61 10 01"},
    {"a missing required field is written as empty", "12 00", "12 02 0A 00", "12 00"},
    {"a text that is not UTF-8 is absent", "1A 03 0A 01 FF", "1A 00", "1A 03 0A 01 FF"},
    {"an endless number is zero", "1A 0B 10 FF FF FF FF FF FF FF FF FF FF", "1A 02 10 00", refused},
    {"an endless length is zero", "1A 0B 0A FF FF FF FF FF FF FF FF FF FF", "1A 02 0A 00", refused},
    {"a field number beyond 29 bits is skipped", "82 80 80 80 20 00", "", refused},
};

TEST(DifferentialList, IsComplete) {
    const auto expected = [](const char* hex) {
        return hex ? std::optional(bytesFromHex(hex)) : std::nullopt;
    };
    for (const auto& difference : differences) {
        const Data bytes = bytesFromHex(difference.hex);
        EXPECT_EQ(ours<VLProtoAudioFilePlayerItem>(bytes), expected(difference.ours)) << difference.name;
        EXPECT_EQ(refereed("VLProtoAudioFilePlayerItem", bytes), expected(difference.theirs))
            << difference.name;
    }
}

/// The published file and the field tables name the same fields.
TEST(PublishedMessages, HaveTheFieldsOfTheTables) {
    AllMessages::forEach([]<class Message>() {
        const auto* descriptor = wire::VLProtoVelmoMessage::descriptor()->file()->FindMessageTypeByName(
            std::string(Message::className));
        ASSERT_TRUE(descriptor) << Message::className;
        std::apply(
            [&](const auto&... row) {
                EXPECT_EQ(descriptor->field_count(), static_cast<int>(sizeof...(row)));
                const auto check = [&](const auto& each) {
                    const auto* field = descriptor->FindFieldByName(std::string(each.name));
                    ASSERT_TRUE(field) << each.name;
                    EXPECT_EQ(field->number(), static_cast<int>(each.number));
                    EXPECT_EQ(field->is_required(), each.isRequired);
                    EXPECT_EQ(field->is_repeated(), each.label == FieldLabel::repeated);
                };
                (check(row), ...);
            },
            Message::fields());
    });
}

} // namespace

} // namespace tarn
