#include "tests/support/CapturedLog.h"
#include "tests/system/controls/ControlsTest.h"
#include "tests/system/controls/FakeLoginManager.h"

namespace tarn {
namespace {

using testing::ElementsAre;

/// The private bus serves as the system bus; there is no session bus.
class SleepTest : public ControlsTest {
protected:
    void SetUp() override {
        controls_ = std::make_unique<LinuxMediaControls>(applicationName,
                                                         LinuxMediaControls::Addresses{"", bus_.address()});
    }

    const CapturedLog log_;
};

TEST_F(SleepTest, TheDeviceStaysAwakeOnlyWhileSomethingPlays) {
    FakeLoginManager manager(bus_.address());
    bringPlayer(track("First", 0, 1));
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    publish(track("First", 10, 0));
    EXPECT_TRUE(manager.waitForLocks({}));
    publish(track("First", 10, 1));
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    player_.reset();
    EXPECT_TRUE(manager.waitForLocks({}));
}

TEST_F(SleepTest, SleepWaitsForThePause) {
    FakeLoginManager manager(bus_.address());
    bringPlayer(track("First", 0, 1));
    ASSERT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    player_->hold();
    manager.prepareForSleep(true);
    ASSERT_TRUE(player_->waitForCommands(1));
    EXPECT_THAT(player_->commands(), ElementsAre("pause"));
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    player_->letGo();
    EXPECT_TRUE(manager.waitForLocks({"idle:block"})); // until the players tell that they have paused
    publish(track("First", 10, 0));
    EXPECT_TRUE(manager.waitForLocks({}));

    manager.prepareForSleep(false);
    publish(track("First", 10, 1));
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    EXPECT_THAT(player_->commands(), ElementsAre("pause")); // nothing resumed by itself
}

TEST_F(SleepTest, APlayThatTakesItsTimeDoesNotHoldUpThePause) {
    controls_ = std::make_unique<LinuxMediaControls>(
        applicationName, LinuxMediaControls::Addresses{bus_.address(), bus_.address()});
    FakeLoginManager manager(bus_.address());
    BusListener listener(bus_.address());
    bringPlayer(track("First", 0, 1));
    ASSERT_TRUE(listener.waitForPlayer());
    ASSERT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    player_->hold("play");
    listener.begin("Play");
    ASSERT_TRUE(player_->waitForCommands(1));

    manager.prepareForSleep(true);
    EXPECT_TRUE(manager.waitForLocks({"idle:block"}));
    EXPECT_THAT(player_->commands(), ElementsAre("play", "pause"));
    EXPECT_EQ(listener.answer(std::chrono::milliseconds(0)), std::nullopt);

    player_->letGo();
    EXPECT_EQ(listener.answer(std::chrono::seconds(10)), "");
    ASSERT_TRUE(player_->waitForCommands(3));
    EXPECT_THAT(player_->commands(), ElementsAre("play", "pause", "pause")); // it does not play on either
}

TEST_F(SleepTest, APlayUnderWayDoesNotBeginInTheMiddleOfTheSleep) {
    controls_ = std::make_unique<LinuxMediaControls>(
        applicationName, LinuxMediaControls::Addresses{bus_.address(), bus_.address()});
    FakeLoginManager manager(bus_.address());
    BusListener listener(bus_.address());
    bringPlayer(track("First", 0, 1));
    ASSERT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    publish(track("First", 5, 0));
    ASSERT_TRUE(manager.waitForLocks({}));
    ASSERT_TRUE(listener.waitForPlayer());
    player_->hold("play");
    listener.begin("Play");
    ASSERT_TRUE(player_->waitForCommands(1));
    manager.prepareForSleep(true);
    ASSERT_TRUE(player_->waitForCommands(2));
    player_->letGo();
    ASSERT_TRUE(player_->waitForCommands(3));
    EXPECT_THAT(player_->commands(), ElementsAre("play", "pause", "pause"));
}

TEST_F(SleepTest, WithoutALoginManagerNothingHappens) {
    bringPlayer(track("First", 0, 1));
    ASSERT_TRUE(log_.waitFor("session bus"));
    publish(track("First", 0, 0));
    publish(track("First", 0, 1));
    player_.reset();
    controls_.reset();
    EXPECT_THAT(log_.messages(),
                ElementsAre(testing::HasSubstr("session bus"))); // about the session bus alone
}

} // namespace
} // namespace tarn
