#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

class SignalsTest : public ControlsTest {
protected:
    void SetUp() override {
        bringPlayer(track("First", 0, 0));
        ASSERT_TRUE(listener_.waitForPlayer());
    }

    BusListener listener_{bus_.address()};
};

TEST_F(SignalsTest, EachEventIsSignalledOnceAndInOrder) {
    publish(track("First", 0, 1));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus");
    publish(track("First", 0, 0));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus");
    publish(track("Second", 0, 0));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
    publish(track("Second", 0, 0)); // nothing new
    publish(track("Second", 60, 0));
    EXPECT_EQ(listener_.next(), "Seeked 60000000");
    publish(track("Third", 0, 0), "org.example.Unknown");
    EXPECT_EQ(listener_.next(), "Root: Identity DesktopEntry");
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
    publish({}, "org.example.Unknown");
    EXPECT_EQ(listener_.next(), cleared); // and one signal too many would have come before
}

TEST_F(SignalsTest, ASecondPlayerAndItsEndAreNoEvents) {
    {
        const FakePlayer another(controls_->remoteCommands());
        publish({});
        EXPECT_EQ(listener_.next(), cleared);
    }
    publish(track("First", 0, 0));
    EXPECT_EQ(listener_.next(), cleared);
}

TEST_F(SignalsTest, PlayingOnIsNoEvent) {
    publish(track("First", 0, 1));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus");
    EXPECT_EQ(listener_.next(std::chrono::milliseconds(1500)), std::nullopt);
}

TEST_F(SignalsTest, OfManyPublicationsTheLastOneIsShown) {
    for (int number = 0; number < 1000; ++number)
        publish(track("Track " + std::to_string(number), 0, 0));
    publish({});
    const auto lines = listener_.until(cleared);
    EXPECT_LE(lines.size(), 1000U);
    for (const std::string& line : lines)
        EXPECT_EQ(line, "Player: PlaybackStatus Metadata");
}

} // namespace
} // namespace tarn
