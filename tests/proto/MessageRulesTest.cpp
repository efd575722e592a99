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

TYPED_TEST(AnyMessage, DescribesItselfByClassAndFields) {
    for (const auto& message : this->messages_) {
        const std::string text = message->description();
        EXPECT_TRUE(text.starts_with("<" + std::string(TypeParam::className)));
        for (const auto& [name, value] : message->dictionaryRepresentation())
            EXPECT_NE(text.find(name + " = "), std::string::npos);
    }
}

} // namespace

} // namespace tarn
