#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class CommandsTest : public ControlsTest {
protected:
    BusListener listener_{bus_.address()};
};

TEST_F(CommandsTest, PlayerctlDrivesThePlayer) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());

    EXPECT_EQ(playerctl({"status"}).output, "Paused\n");
    EXPECT_EQ(playerctl({"metadata", "--format", "{{artist}}|{{album}}|{{title}}|{{mpris:length}}"}).output,
              "Someone|Songs|First|180000000\n");
    for (const char* verb : {"play", "pause", "play-pause", "next", "stop"})
        EXPECT_EQ(playerctl({verb}).status, 0) << verb;
    EXPECT_THAT(player_->commands(), ElementsAre("play", "pause", "toggle", "next", "pause"));

    EXPECT_NE(playerctl({"previous"}).status, 0);
    EXPECT_NE(playerctl({"position", "10"}).status, 0);
    EXPECT_NE(playerctl({"open", "file:///etc/passwd"}).status, 0);
    EXPECT_EQ(player_->commands().size(), 5U);
}

TEST_F(CommandsTest, PlayerctlFollows) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    ChildProcess follower(
        {"playerctl", "--player=tarnd", "--follow", "metadata", "--format", "{{status}} {{title}}"},
        {bus_.environment()});
    EXPECT_EQ(follower.readLine(), "Paused First");
    publish(track("First", 0, 1));
    EXPECT_EQ(follower.readLine(), "Playing First");
    publish(track("Second", 0, 1));
    EXPECT_EQ(follower.readLine(), "Playing Second");
}

TEST_F(CommandsTest, AnAnswerTellsWhatTheHandlerSaid) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    EXPECT_EQ(listener_.call("Play"), "");
    player_->answerWith(RemoteCommandResult::noSuchContent);
    EXPECT_EQ(listener_.call("Next"), "ostrel.tarnd.Error.NoSuchContent");
    player_->answerWith(RemoteCommandResult::commandFailed);
    EXPECT_EQ(listener_.call("Pause"), "ostrel.tarnd.Error.CommandFailed");
    EXPECT_THAT(player_->commands(), ElementsAre("play", "next", "pause"));
}

TEST_F(CommandsTest, WithoutATrackCommandsHaveNoEffect) {
    bringPlayer({});
    ASSERT_TRUE(listener_.waitForPlayer());
    for (const char* method : {"Play", "Next", "Previous"})
        EXPECT_EQ(listener_.call(method), "") << method;
    EXPECT_EQ(listener_.call("PlayPause"), "ostrel.tarnd.Error.CommandFailed");
    EXPECT_THAT(player_->commands(), IsEmpty());
    EXPECT_EQ(listener_.call("Pause"), "");
    EXPECT_TRUE(player_->waitForCommands(1)); // it may be urgent
}

TEST_F(CommandsTest, AnActivationThatTakesItsTimeHoldsUpOnlyCommands) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    player_->hold();
    listener_.begin("Play");
    ASSERT_TRUE(player_->waitForCommands(1));

    EXPECT_EQ(listener_.readAllProperties(), 20);
    publish(track("Second", 0, 0));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
    EXPECT_EQ(listener_.answer(std::chrono::milliseconds(50)), std::nullopt);

    player_->letGo();
    EXPECT_EQ(listener_.answer(std::chrono::seconds(10)), "");
}

TEST_F(CommandsTest, AFloodOfCommandsIsRefusedAndAnsweredAllTheSame) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    player_->hold();
    constexpr int flood = 200;
    constexpr int taken = 65; // the one that is held, and those that may wait
    listener_.begin("Play");
    ASSERT_TRUE(player_->waitForCommands(1));
    for (int count = 1; count < flood; ++count)
        listener_.begin("Play");
    for (int count = taken; count < flood; ++count)
        EXPECT_EQ(listener_.answer(std::chrono::seconds(10)), "org.freedesktop.DBus.Error.LimitsExceeded");
    player_->letGo();
    for (int count = 0; count < taken; ++count)
        EXPECT_EQ(listener_.answer(std::chrono::seconds(10)), "");
    EXPECT_EQ(player_->commands().size(), static_cast<std::size_t>(taken));
    EXPECT_EQ(listener_.call("Pause"), "");
}

TEST_F(CommandsTest, AnAnswerToALostBusIsForgotten) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    player_->hold();
    listener_.begin("Play");
    ASSERT_TRUE(player_->waitForCommands(1));
    bus_.kill();
    bus_.start();
    BusListener again(bus_.address());
    ASSERT_TRUE(again.waitForPlayer());
    player_->letGo();
    EXPECT_EQ(again.call("Pause"), "");
}

TEST_F(CommandsTest, PreviousAndSeekingAreRefusedWithoutAnError) {
    bringPlayer(track("First", 10, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    EXPECT_EQ(listener_.call("Previous"), "");
    const auto seek =
        runCommand({"busctl", "--address=" + bus_.address(), "call", BusListener::playerName,
                    "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2.Player", "Seek", "x", "5000000"});
    EXPECT_EQ(seek.status, 0);
    const auto opening = runCommand({"busctl", "--address=" + bus_.address(), "call", BusListener::playerName,
                                     "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2.Player", "OpenUri",
                                     "s", "file:///etc/passwd"});
    EXPECT_THAT(opening.output, HasSubstr("given its files by its own clients"));
    EXPECT_THAT(player_->commands(), IsEmpty());
}

} // namespace
} // namespace tarn
