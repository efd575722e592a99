// The rules that all messages share, over random messages of every class.

#include <gtest/gtest.h>

#include <set>
#include <thread>

#include "proto/MessagePool.h"
#include "tests/proto/AllMessages.h"
#include "tests/proto/Generator.h"

namespace tarn {

namespace {

/// Twenty random messages of one class, and the empty one.
template <class Message>
class AnyMessage : public testing::Test {
protected:
    AnyMessage() {
        messages_.push_back(std::make_shared<Message>());
        Generator generator(7, Generator::Style::plain);
        for (int count = 0; count < 20; ++count)
            messages_.push_back(Message::fromData(generator.encodingOf<Message>()));
    }

    std::vector<std::shared_ptr<Message>> messages_;
};

TYPED_TEST_SUITE(AnyMessage, AllMessages::As<testing::Types>);

TYPED_TEST(AnyMessage, EncodesWhatItDecoded) {
    Generator generator(11, Generator::Style::plain);
    for (int count = 0; count < 50; ++count) {
        const Data encoding = generator.encodingOf<TypeParam>();
        const auto message = TypeParam::fromData(encoding);
        ASSERT_TRUE(message);
        EXPECT_EQ(message->serialize(), encoding);
    }
}

TYPED_TEST(AnyMessage, DecodesFieldsInAnyOrderAndDropsUnknownOnes) {
    Generator generator(13, Generator::Style::scrambled);
    for (int count = 0; count < 50; ++count) {
        const auto message = TypeParam::fromData(generator.encodingOf<TypeParam>());
        ASSERT_TRUE(message);
        const auto again = TypeParam::fromData(message->serialize());
        ASSERT_TRUE(again);
        EXPECT_EQ(again->serialize(), message->serialize());
    }
}

TYPED_TEST(AnyMessage, EqualsItsCopiesAndHashesAlike) {
    for (const auto& message : this->messages_) {
        const auto copy = message->copyWithZone();
        EXPECT_NE(copy, message);
        EXPECT_TRUE(copy->isEqual(*message));
        EXPECT_EQ(copy->hash(), message->hash());
        EXPECT_EQ(copy->dictionaryRepresentation(), message->dictionaryRepresentation());
    }
}

TYPED_TEST(AnyMessage, EqualsNothingThatEncodesDifferently) {
    for (const auto& one : this->messages_) {
        for (const auto& other : this->messages_) {
            if (one->serialize() != other->serialize()) {
                EXPECT_FALSE(one->isEqual(*other));
            }
        }
    }
}

TYPED_TEST(AnyMessage, CopiesAndMergesIntoAnEmptyMessageAlike) {
    for (const auto& message : this->messages_) {
        TypeParam copied;
        message->copyTo(copied);
        EXPECT_TRUE(copied.isEqual(*message));
        TypeParam merged;
        merged.mergeFrom(*message);
        EXPECT_TRUE(merged.isEqual(*message));
    }
}

TYPED_TEST(AnyMessage, SurvivesCopyingAndMergingItself) {
    for (const auto& message : this->messages_) {
        const auto copy = message->copyWithZone();
        copy->copyTo(*copy);
        EXPECT_TRUE(copy->isEqual(*message));
        copy->mergeFrom(*copy);
        EXPECT_TRUE(TypeParam::fromData(copy->serialize()));
    }
}

TYPED_TEST(AnyMessage, EqualsNoMessageOfAnotherClass) {
    const TypeParam empty;
    AllMessages::forEach([&]<class Other>() {
        if constexpr (!std::same_as<Other, TypeParam>) {
            EXPECT_FALSE(empty.isEqual(Other()));
        }
    });
}

TYPED_TEST(AnyMessage, CutAtAnyLengthIsDecodedOrRefused) {
    for (const auto& message : this->messages_) {
        const Data whole = message->serialize();
        for (std::size_t length = 0; length <= whole.size(); ++length) {
            const Data cut(whole.begin(),
                           whole.begin() + static_cast<std::ptrdiff_t>(length)); // its own block
            const auto decoded = TypeParam::fromData(cut);
            if (length == whole.size()) {
                EXPECT_TRUE(decoded);
            }
            if (decoded) {
                EXPECT_TRUE(TypeParam::fromData(decoded->serialize()));
            }
        }
    }
}

TYPED_TEST(AnyMessage, DescribesItselfByClassAndFields) {
    for (const auto& message : this->messages_) {
        const std::string text = message->description();
        EXPECT_TRUE(text.starts_with("<" + std::string(TypeParam::className)));
        for (const auto& [name, value] : message->dictionaryRepresentation())
            EXPECT_NE(text.find(name + " = "), std::string::npos);
    }
}

TEST(MessagePool, LendsABlockToOneMessageAtATimeWhicheverThreadLetsItGo) {
    using Message = VLProtoAudioFilePlayerCurrentTime;
    std::vector<std::shared_ptr<Message>> messages;
    double next = 0;
    const auto make = [&] {
        messages.push_back(newMessage<Message>());
        messages.back()->setCurrentTime(next++);
    };
    for (int round = 0; round < 50; ++round) {
        while (messages.size() < 500)
            make();
        std::thread([&] { // when it ends, it leaves blocks behind that others may use
            messages.erase(messages.begin() + round, messages.begin() + 300 + round);
            make();
        })
            .join();
        std::set<double> values;
        for (const auto& message : messages)
            values.insert(message->currentTime());
        ASSERT_EQ(values.size(), messages.size());
    }
}

} // namespace

} // namespace tarn
