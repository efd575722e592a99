#include "tests/support/CapturedLog.h"
#include "tests/system/controls/ControlsTest.h"
#include "tests/system/controls/FakeLoginManager.h"

namespace tarn {
namespace {

using testing::ElementsAre;

const std::vector<std::string> awake = {"idle:block", "sleep:delay"};

/// The private bus serves as the system bus, too.
class SleepTest : public ControlsTest {
protected:
    SleepTest() {
        controls_ = std::make_unique<LinuxMediaControls>(
            applicationName, LinuxMediaControls::Addresses{bus_.address(), bus_.address()});
    }

    const CapturedLog log_;
    FakeLoginManager manager_{bus_.address()};
};

TEST_F(SleepTest, TheDeviceStaysAwakeOnlyWhileSomethingPlays) {
    bringPlayer(1);
    EXPECT_TRUE(manager_.waitForLocks(awake));
    auto held = playing(1);
    held.isHeld = true;
    for (const PlaybackState& silent : {playing(0), held}) {
        player_->tell(silent);
        EXPECT_TRUE(manager_.waitForLocks({}));
        player_->tell(playing(1));
        EXPECT_TRUE(manager_.waitForLocks(awake));
    }
    publish({}); // on behalf of another player
    const auto other = FakePlayer::make(controls_->remoteCommands());
    manager_.prepareForSleep(false);
    EXPECT_TRUE(manager_.waitForLocks(awake));
    player_.reset();
    EXPECT_TRUE(manager_.waitForLocks({}));
}

TEST_F(SleepTest, SleepWaitsForThePause) {
    bringPlayer(1);
    ASSERT_TRUE(manager_.waitForLocks(awake));
    player_->hold();
    manager_.prepareForSleep(true);
    ASSERT_TRUE(player_->waitForCommands(1));
    EXPECT_TRUE(manager_.waitForLocks(awake));
    player_->letGo();
    EXPECT_TRUE(manager_.waitForLocks({"idle:block"})); // until the players tell that they have paused
    player_->tell(playing(0));
    EXPECT_TRUE(manager_.waitForLocks({}));
    manager_.prepareForSleep(false);
    player_->tell(playing(1));
    EXPECT_TRUE(manager_.waitForLocks(awake));
    EXPECT_THAT(player_->commands(), ElementsAre("pause")); // nothing resumed by itself
}

} // namespace
} // namespace tarn
