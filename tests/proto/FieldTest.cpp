// Presence, sharing, comparing and hashing where the kinds of fields differ.

#include <cmath>
#include <limits>

#include <gtest/gtest.h>

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/VelmoMessage.h"
#include "tests/proto/Hex.h"

namespace tarn {

namespace {

using Items = VLProtoAudioFileQueuePlayerSetItems;
using MetaData = VLProtoAudioFilePlayerAssetUpdateMetaData;
using Status = VLProtoAudioFilePlayerStatus;

TEST(OptionalScalar, IsPresentOnceSetAndKeepsItsValueWhenMarkedAbsent) {
    MetaData message;
    EXPECT_FALSE(message.hasDuration());
    EXPECT_EQ(message.duration(), 0);
    message.setDuration(0);
    EXPECT_TRUE(message.hasDuration());
    message.setDuration(2);
    message.setHasDuration(false);
    EXPECT_EQ(message.duration(), 2);
    EXPECT_FALSE(message.dictionaryRepresentation().contains("duration"));
    const auto copy = message.copyWithZone();
    EXPECT_EQ(copy->duration(), 0) << "what is marked absent is not copied";
    EXPECT_TRUE(copy->isEqual(message));
}

TEST(OptionalText, DiffersWhenAbsentAndWhenEmpty) {
    MetaData absent;
    MetaData empty;
    empty.setTitle("");
    EXPECT_FALSE(absent.isEqual(empty));
    EXPECT_FALSE(empty.isEqual(absent));
    EXPECT_EQ(empty.serialize(), bytesFromHex("0A 00 22 00"));
    EXPECT_TRUE(empty.hasTitle());
}

TEST(EmbeddedMessage, IsSharedByCopyToAndDuplicatedByCopyWithZone) {
    VLProtoAudioFilePlayerItem item;
    item.setSetStatus(std::make_shared<Status>());
    VLProtoAudioFilePlayerItem shallow;
    item.copyTo(shallow);
    const auto deep = item.copyWithZone();
    item.setStatus()->setStatus(2);
    EXPECT_EQ(shallow.setStatus()->status(), 2);
    EXPECT_EQ(deep->setStatus()->status(), 0);
}

TEST(EmbeddedMessage, IsMergedWhereBothHaveItAndTakenWhereOneHas) {
    VLProtoAudioFilePlayerItem from;
    from.setSetStatus(std::make_shared<Status>());
    from.setStatus()->setStatus(2);
    VLProtoAudioFilePlayerItem empty;
    empty.mergeFrom(from);
    EXPECT_EQ(empty.setStatus(), from.setStatus());

    VLProtoAudioFilePlayerItem into;
    into.setSetStatus(std::make_shared<Status>());
    into.setStatus()->setIdentifier("a");
    into.mergeFrom(from);
    EXPECT_NE(into.setStatus(), from.setStatus());
    EXPECT_EQ(into.setStatus()->identifier(), "a");
    EXPECT_EQ(into.setStatus()->status(), 2);
}

TEST(List, DiffersWhenNeverMadeAndWhenEmptied) {
    Items never;
    Items emptied;
    never.clearPlayerItemIdentifiers();
    EXPECT_FALSE(never.playerItemIdentifiers());
    emptied.addPlayerItemIdentifiers("a");
    emptied.clearPlayerItemIdentifiers();
    EXPECT_FALSE(never.isEqual(emptied));
    EXPECT_FALSE(emptied.isEqual(never));
    EXPECT_EQ(never.serialize(), emptied.serialize());
    EXPECT_TRUE(emptied.dictionaryRepresentation().contains("playerItemIdentifiers"));
    EXPECT_FALSE(emptied.copyWithZone()->playerItemIdentifiers())
        << "a copy appends, and there is nothing to append";

    VLProtoVelmoPlist objects;
    objects.addObject(std::make_shared<VLProtoVelmoObject>());
    objects.clearObjects();
    EXPECT_TRUE(objects.objects());
    EXPECT_TRUE(objects.dictionaryRepresentation().empty());
}

TEST(List, IsReplacedByCopyToUnlessEmptyAndAppendedByMerge) {
    Items target;
    target.addPlayerItemIdentifiers("a");
    Items{}.copyTo(target);
    EXPECT_EQ(target.playerItemIdentifiersCount(), 1U);
    Items source;
    source.addPlayerItemIdentifiers("b");
    target.mergeFrom(source);
    EXPECT_EQ(*target.playerItemIdentifiers(), (TextList{"a", "b"}));
    source.copyTo(target);
    EXPECT_EQ(*target.playerItemIdentifiers(), TextList{"b"});
    target.mergeFrom(target);
    EXPECT_EQ(target.playerItemIdentifiersCount(), 2U);
    EXPECT_THROW(target.playerItemIdentifiersAtIndex(2), std::out_of_range);
    target.clearPlayerItemIdentifiers();
    target.addPlayerItemIdentifiers("c");
    EXPECT_EQ(*target.playerItemIdentifiers(), TextList{"c"});
}

TEST(FloatingPoint, ComparesAsNumbersDo) {
    VLProtoAudioFilePlayerCurrentTime one;
    VLProtoAudioFilePlayerCurrentTime other;
    one.setCurrentTime(0.0);
    other.setCurrentTime(-0.0);
    EXPECT_TRUE(one.isEqual(other));
    EXPECT_EQ(one.hash(), other.hash());
    one.setCurrentTime(std::numeric_limits<double>::quiet_NaN());
    EXPECT_FALSE(one.isEqual(one));
}

TEST(Hash, HasTheTermsThatOthersComputeToo) {
    const auto term = [](double value) {
        VLProtoAudioFilePlayerCurrentTime message;
        message.setCurrentTime(value);
        return message.hash();
    };
    EXPECT_EQ(term(2.25), 2087646049U);
    EXPECT_EQ(term(2.75), 3668339987U);
    EXPECT_EQ(term(-2.25), 2087646049U);
    EXPECT_EQ(term(0), 0U);
    EXPECT_EQ(term(std::numeric_limits<double>::quiet_NaN()), 0U);
    EXPECT_EQ(term(std::numeric_limits<double>::infinity()), 0U);

    VLProtoVelmoObject object;
    object.setType(3);
    EXPECT_EQ(object.hash(), 3 * 2654435761U);
    object.setNfloat(2.25F);
    EXPECT_EQ(object.hash(), (3 * 2654435761U) ^ 2087646049U);
    object.setNint64(-1);
    EXPECT_EQ(object.hash(), (3 * 2654435761U) ^ 2087646049U ^ (0U - 2654435761U));
    object.setHasNfloat(false);
    object.setHasNint64(false);
    EXPECT_EQ(object.hash(), 3 * 2654435761U);
}

TEST(RequiredText, IsCopiedEvenWhenAbsentButNotMerged) {
    const MetaData absent;
    MetaData target;
    target.setIdentifier("a");
    target.mergeFrom(absent);
    EXPECT_EQ(target.identifier(), "a");
    absent.copyTo(target);
    EXPECT_FALSE(target.identifier());
}

} // namespace

} // namespace tarn
