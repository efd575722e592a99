// How bytes become a message where that is not obvious, and where it differs from what Protocol Buffers
// libraries do.

#include <gtest/gtest.h>

#include "proto/VelmoMessage.h"
#include "tests/proto/Hex.h"
#include "wire/ProtoReader.h"

namespace tarn {

namespace {

using Object = VLProtoVelmoObject;
using Status = VLProtoAudioFilePlayerStatus;

template <class Message>
std::shared_ptr<Message> decoded(std::string_view hex) {
    return Message::fromData(bytesFromHex(hex));
}

TEST(Decoding, SkipsTheRestOfAnEmbeddedMessageThatEndedEarly) {
    // Object message: end of group, then bytes that are no field; afterwards the item's destroy.
    const auto item = decoded<VLProtoAudioFilePlayerItem>("0A 03 0C FF FF 12 03 0A 01 61");
    ASSERT_TRUE(item && item->hasUpsertWithAsset() && item->hasDestroy());
    EXPECT_EQ(item->destroy()->identifier(), "a");
}

TEST(Decoding, ReadsAKnownFieldAsItsKindWhateverTheKeySays) {
    EXPECT_EQ(decoded<Status>("08 01 61")->identifier(), "a");                // key says varint
    EXPECT_EQ(decoded<Status>("12 07")->status(), 7);                         // key says length-delimited
    EXPECT_EQ(decoded<Object>("30 00 00 00 00 00 00 F8 3F")->ndouble(), 1.5); // key says varint
}

TEST(Decoding, KeepsTheLowHalfOfNumbersOf32Bits) {
    EXPECT_EQ(decoded<Object>("10 81 80 80 80 10")->subtype(), 1);
    EXPECT_EQ(decoded<Object>("10 FF FF FF FF FF FF FF FF FF 01")->subtype(), -1);
    EXPECT_TRUE(decoded<Object>("60 80 80 80 80 10")->nbool());
}

TEST(Decoding, SkipsGroupsThatCloseAndRefusesOthers) {
    EXPECT_TRUE(decoded<Status>("A3 01 AB 01 08 01 AC 01 A4 01 10 01")->hasStatus());
    EXPECT_FALSE(decoded<Status>("A3 01 AC 01"));       // closes another one
    EXPECT_FALSE(decoded<Status>("A3 01 08 01"));       // never closes
    EXPECT_FALSE(decoded<Status>("A6 01"));             // a wire type that does not exist
    EXPECT_FALSE(decoded<Status>("A3 01 A7 01 A4 01")); // so inside of a group
}

TEST(Decoding, LetsATextThatIsNotUtf8BeAbsent) {
    for (const char* text :
         {"01 FF", "02 C0 80", "03 ED A0 80", "04 F4 90 80 80", "02 E2 82", "08 61 61 61 61 61 61 61 C3"})
        EXPECT_FALSE(decoded<Status>(std::string("0A ") + text)->hasIdentifier()) << text;
    EXPECT_FALSE(decoded<Status>("0A 01 61 0A 01 FF")->hasIdentifier()) << "an earlier value goes as well";
    EXPECT_TRUE(decoded<Status>("0A 04 F0 9F 8E B5")->hasIdentifier());
    const auto items = decoded<VLProtoAudioFileQueuePlayerSetItems>("12 01 61 12 01 FF 12 01 62");
    EXPECT_EQ(items->playerItemIdentifiersCount(), 2U);
}

TEST(Decoding, RefusesWhatRunsPastTheEnd) {
    for (const char* hex :
         {"0A 02 61", "0A FF FF FF FF 0F", "0A FF FF FF FF FF FF FF FF FF 01", "10", "10 80", "80"})
        EXPECT_FALSE(decoded<Status>(hex)) << hex;
    for (const char* hex : {"31 00 00 00", "3D 00 00 00", "30"})
        EXPECT_FALSE(decoded<Object>(hex)) << hex;
    EXPECT_FALSE(decoded<VLProtoAudioFilePlayerItem>("1A 03 10 01"))
        << "an embedded message longer than the rest";
    EXPECT_FALSE(decoded<VLProtoAudioFilePlayerItem>("1A 02 0A 05 61 61 61 61 61"))
        << "a text longer than its message";
}

TEST(Decoding, LeavesWhatItReadBeforeAFailure) {
    Object object;
    const Data bytes = bytesFromHex("08 05 10 01 31 00");
    ProtoReader reader(bytes);
    EXPECT_FALSE(object.readFrom(reader));
    EXPECT_EQ(object.type(), 5);
    EXPECT_TRUE(object.hasNdouble()) << "cut off, yet it was there";
    EXPECT_EQ(object.ndouble(), 0);

    VLProtoAudioFilePlayerItem item;
    const Data nested = bytesFromHex("12 05 0A");
    ProtoReader nestedReader(nested);
    EXPECT_FALSE(item.readFrom(nestedReader));
    EXPECT_TRUE(item.hasDestroy());
}

/// Whatever nests on the wire must not nest on the stack.
TEST(Decoding, RefusesDeepGroups) {
    constexpr std::size_t mebibyte = 1U << 20;
    EXPECT_FALSE(Status::fromData(Data(mebibyte, 0x33))); // start of group 6, over and over
    Data pairs(mebibyte, 0x33);
    for (std::size_t index = 1; index < pairs.size(); index += 2)
        pairs[index] = 0x34;
    EXPECT_TRUE(Status::fromData(pairs));
}

} // namespace

} // namespace tarn
