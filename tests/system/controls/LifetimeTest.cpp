#include "tests/support/CapturedLog.h"
#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

using testing::HasSubstr;
using testing::SizeIs;

class LifetimeTest : public ControlsTest {};

TEST_F(LifetimeTest, ThePlayerIsOnTheBusOnlyWhileAQueuePlayerLives) {
    for (int round = 0; round < 3; ++round) {
        bringPlayer();
        EXPECT_EQ(bus_.property("PlaybackStatus"),
                  "s \"Paused\""); // the object is there as soon as the name is
        player_.reset();
        ASSERT_EQ(listener_.next(), "vanished");
        EXPECT_THAT(bus_.property("PlaybackStatus"), HasSubstr("not provided by any"));
    }
}

TEST_F(LifetimeTest, ThePlayerComesBackWithTheBus) {
    const CapturedLog log;
    bringPlayer(1);
    constexpr int rounds = 5;
    for (int round = 0; round < rounds; ++round) {
        player_->hold();
        ChildProcess waiting(bus_.calling({"Pause"})); // nobody is there to hear the answer
        ASSERT_TRUE(player_->waitForCommands(2 * static_cast<std::size_t>(round) + 1));
        bus_.kill();
        ASSERT_TRUE(log.waitFor("out of reach"));
        publish(track("Round " + std::to_string(round)));
        bus_.start();
        SignalListener listener(bus_);
        player_->letGo();
        while (bus_.property("PlaybackStatus") != "s \"Playing\"")
            ASSERT_EQ(listener.next(), "appeared");
        ASSERT_EQ(bus_.call({"Pause"}), "");
    }
    EXPECT_THAT(bus_.property("Metadata"), HasSubstr("Round 4"));
    EXPECT_THAT(log.errors(), SizeIs(rounds));
    EXPECT_THAT(log.messages(), SizeIs(2 * rounds)); // one line for each end and each return
}

TEST_F(LifetimeTest, ABusThatHangsHoldsUpNobody) {
    bringPlayer(1);
    bus_.signal(SIGSTOP);
    for (int number = 0; number < 10000; ++number)
        publish(track("Track " + std::to_string(number)));
    bus_.signal(SIGCONT);
    player_->tell({});
    EXPECT_THAT(listener_.until(everything), testing::Not(testing::Contains("vanished")));
}

TEST(LateBusTest, TheServiceGoesOnWithoutABusAndFindsItWhenItComes) {
    const CapturedLog log;
    PrivateBus bus(PrivateBus::State::notYetStarted);
    const auto nameless = [](const std::string&) { return std::nullopt; };
    LinuxMediaControls controls(nameless, {bus.address(), ""});
    const auto player = FakePlayer::make(controls.remoteCommands());
    ASSERT_TRUE(log.waitFor("The session bus is out of reach"));
    bus.start();
    ASSERT_TRUE(log.waitFor("The session bus is back"));
    EXPECT_THAT(log.messages(), SizeIs(2));

    const CapturedLog second;
    LinuxMediaControls withoutAddress(nameless, {"", ""});
    const auto lonely = FakePlayer::make(withoutAddress.remoteCommands());
    EXPECT_TRUE(second.waitFor("The session bus is out of reach"));
}

TEST_F(LifetimeTest, ASecondServiceHasANameOfItsOwn) {
    SignalListener second(bus_, "org.mpris.MediaPlayer2.tarnd.instance" + std::to_string(getpid()));
    bringPlayer();
    LinuxMediaControls another(applicationName, {bus_.address(), ""});
    const auto other = FakePlayer::make(another.remoteCommands());
    EXPECT_THAT(second.until("appeared"), testing::Not(testing::Contains(HasSubstr("no "))));
}

} // namespace
} // namespace tarn
