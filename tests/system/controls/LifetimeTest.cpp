#include "tests/support/CapturedLog.h"
#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

using std::chrono::seconds;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::SizeIs;

class LifetimeTest : public ControlsTest {};

TEST_F(LifetimeTest, ThePlayerIsOnTheBusOnlyWhileAQueuePlayerLives) {
    BusListener listener(bus_.address());
    publish(track("First", 0, 0)); // shows nothing yet
    for (int round = 0; round < 3; ++round) {
        bringPlayer(track("First", 0, 0));
        ASSERT_EQ(listener.next(), "appeared");
        // The object is there as soon as the name is.
        EXPECT_EQ(listener.readAllProperties(), 20);
        player_.reset();
        ASSERT_EQ(listener.next(), "vanished");
        EXPECT_EQ(listener.readAllProperties(), 0);
    }
}

TEST_F(LifetimeTest, TheEndOfThePlayerDoesNotCostItsLastAnswer) {
    BusListener listener(bus_.address());
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener.waitForPlayer());
    RegistrationHandle held = controls_->remoteCommands().playCommand().addTarget([&] {
        player_.reset();
        EXPECT_EQ(listener.next(), "vanished");
        return RemoteCommandResult::success;
    });
    const auto played = playerctl({"play"});
    EXPECT_EQ(played.status, 0) << played.output;
}

TEST_F(LifetimeTest, ASecondServiceHasANameOfItsOwn) {
    const std::string instance =
        std::string(BusListener::playerName) + ".instance" + std::to_string(getpid());
    BusListener first(bus_.address());
    BusListener second(bus_.address(), instance);
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(first.waitForPlayer());

    LinuxMediaControls another(applicationName, {bus_.address(), ""});
    another.setNowPlayingInfo(NowPlayingService::Origin::local, track("Other", 0, 0),
                              NowPlayingService::mergePolicyReplace);
    FakePlayer anotherPlayer(another.remoteCommands());
    ASSERT_TRUE(second.waitForPlayer());
    EXPECT_EQ(second.call("Play"), "");
    EXPECT_THAT(anotherPlayer.commands(), ElementsAre("play"));
    EXPECT_THAT(player_->commands(), ElementsAre());
}

TEST_F(LifetimeTest, ThePlayerComesBackWithTheBus) {
    const CapturedLog log;
    bringPlayer(track("First", 0, 1));
    constexpr int rounds = 20;
    for (int round = 0; round < rounds; ++round) {
        BusListener listener(bus_.address());
        ASSERT_TRUE(listener.waitForPlayer(seconds(2))) << round;
        ASSERT_EQ(listener.call("Pause"), "") << round;
        bus_.kill();
        ASSERT_TRUE(log.waitFor("out of reach"));
        publish(track("Round " + std::to_string(round), 0, 1)); // nobody hears it, and nobody minds
        bus_.start();
    }
    BusListener listener(bus_.address());
    ASSERT_TRUE(listener.waitForPlayer(seconds(2)));
    EXPECT_THAT(playerctl({"metadata", "title"}).output, HasSubstr("Round 19"));
    ASSERT_EQ(listener.call("Play"), "");
    EXPECT_THAT(log.errors(), SizeIs(rounds));
    EXPECT_THAT(log.messages(), SizeIs(2 * rounds)); // one line for each end and each return
}

TEST(LateBusTest, TheServiceGoesOnWithoutABusAndFindsItWhenItComes) {
    const CapturedLog log;
    PrivateBus bus(PrivateBus::State::notYetStarted);
    LinuxMediaControls controls([](const std::string&) { return std::nullopt; }, {bus.address(), ""});
    const FakePlayer player(controls.remoteCommands());
    ASSERT_TRUE(log.waitFor("The session bus is out of reach"));
    bus.start();
    BusListener listener(bus.address());
    EXPECT_TRUE(listener.waitForPlayer(seconds(2)));
    EXPECT_THAT(log.errors(), SizeIs(1));
}

TEST(LateBusTest, WithoutAnAddressThereIsOneLine) {
    const CapturedLog log;
    LinuxMediaControls controls([](const std::string&) { return std::nullopt; }, {"", ""});
    const FakePlayer player(controls.remoteCommands());
    ASSERT_TRUE(log.waitFor("The session bus is out of reach"));
    EXPECT_THAT(log.messages(), SizeIs(1));
}

TEST_F(LifetimeTest, ABusThatHangsHoldsUpNobody) {
    bringPlayer(track("First", 0, 1));
    BusListener listener(bus_.address());
    ASSERT_TRUE(listener.waitForPlayer());
    bus_.signal(SIGSTOP);
    for (int number = 0; number < 10000; ++number)
        publish(track("Track " + std::to_string(number), 0, 1));
    bus_.signal(SIGCONT);
    publish({});
    EXPECT_THAT(listener.until(cleared), testing::Not(testing::Contains("vanished")));
}

} // namespace
} // namespace tarn
