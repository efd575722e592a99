#include "controls/BusLoop.h"
#include "controls/RemoteCommandThread.h"
#include "controls/RemoteTargets.h"
#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class MediaPlayerTest : public ControlsTest {};

TEST_F(MediaPlayerTest, EveryPropertyHasItsTypeAndValue) {
    bringPlayer();
    const std::array<std::array<std::string, 3>, 20> expected = {{
        {"", "CanQuit", "b false"},
        {"", "CanRaise", "b false"},
        {"", "HasTrackList", "b false"},
        {"", "Identity", "s \"Music Box\""},
        {"", "DesktopEntry", "s \"org.example.MusicBox\""},
        {"", "SupportedUriSchemes", "as 0"},
        {"", "SupportedMimeTypes", "as 0"},
        {".Player", "PlaybackStatus", "s \"Paused\""},
        {".Player", "Rate", "d 1"},
        {".Player", "MinimumRate", "d 0.03125"},
        {".Player", "MaximumRate", "d 32"},
        {".Player", "Volume", "d 1"},
        {".Player", "Position", "x 30000000"},
        {".Player", "CanGoNext", "b true"},
        {".Player", "CanGoPrevious", "b false"},
        {".Player", "CanPlay", "b true"},
        {".Player", "CanPause", "b true"},
        {".Player", "CanSeek", "b true"},
        {".Player", "CanControl", "b true"},
        {".Player", "Metadata",
         R"(a{sv} 5 "mpris:trackid" o "/ostrel/tarnd/track/1" "mpris:length" x 180000000 "xesam:title" s "First" )"
         R"("xesam:artist" as 1 "Someone" "xesam:album" s "Songs")"},
    }};
    for (const auto& [interface, name, value] : expected)
        EXPECT_EQ(bus_.property(name, interface), value) << name;
}

TEST_F(MediaPlayerTest, EachEventIsSignalledOnceAndInOrder) {
    bringPlayer();
    player_->tell(playing(1));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus");
    publish(track("First")); // nothing new
    auto moved = playing(1);
    moved.position = {90, 1};
    moved.seeks = 1;
    player_->tell(moved);
    EXPECT_EQ(listener_.next(), "Seeked 90000000");
    EXPECT_EQ(bus_.property("Position"), "x 90000000");
    publish(track("Second"), "org.example.Blank");
    EXPECT_EQ(listener_.next(), "Root: Identity DesktopEntry");
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
    EXPECT_EQ(bus_.property("Identity", ""), "s \"tarnd\"");
    player_->tell({});
    EXPECT_EQ(listener_.next(), everything);
    for (const char* method : {"Play", "Next", "Previous"})
        EXPECT_EQ(bus_.call({method}), "") << method;
    EXPECT_THAT(bus_.call({"PlayPause"}), HasSubstr("nothing to play"));
    EXPECT_THAT(player_->commands(), IsEmpty());
    EXPECT_EQ(bus_.call({"Pause"}), "");
    EXPECT_TRUE(player_->waitForCommands(1)) << "it may be urgent";
}

TEST_F(MediaPlayerTest, WhatPlaysIsControlledAndShownWhateverWasPublishedLast) {
    bringPlayer(2);
    publish(track("Second"));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
    const auto other = FakePlayer::make(controls_->remoteCommands(), {.item = std::make_shared<FakeItem>()});
    EXPECT_EQ(bus_.property("PlaybackStatus"), "s \"Playing\"");
    EXPECT_EQ(bus_.property("Position"), "x 30000000");
    EXPECT_EQ(bus_.call({"PlayPause"}), "");
    EXPECT_EQ(bus_.call({"Next"}), "");
    EXPECT_THAT(player_->commands(), ElementsAre("pause", "next"));
    EXPECT_THAT(other->commands(), ElementsAre("pause"));
    auto held = playing(2);
    held.isHeld = true;
    player_->tell(held);
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Rate");
    EXPECT_EQ(bus_.property("PlaybackStatus"), "s \"Paused\"");
}

TEST_F(MediaPlayerTest, PositionAndRateCanBeSet) {
    bringPlayer(1);
    EXPECT_EQ(bus_.call({"Seek", "x", "5000000"}), "");
    EXPECT_EQ(bus_.call({"Seek", "x", "-9223372036854775808"}), "");
    EXPECT_EQ(bus_.call({"SetPosition", "ox", "/ostrel/tarnd/track/1", "60000000"}), "");
    for (const auto& [path, time] :
         {std::pair("/ostrel/tarnd/track/2", "60000000"), std::pair("/ostrel/tarnd/track/1", "-1"),
          std::pair("/ostrel/tarnd/track/1", "180000001")})
        EXPECT_EQ(bus_.call({"SetPosition", "ox", path, time}), "");
    EXPECT_EQ(item_->movedTo().size(), 3U);
    EXPECT_EQ(item_->movedTo().front(), 35);
    EXPECT_LT(item_->movedTo().at(1), 0) << "the engine begins at the start";
    EXPECT_EQ(item_->movedTo().back(), 60);
    EXPECT_THAT(player_->commands(), IsEmpty());
    EXPECT_EQ(bus_.call({"Seek", "x", "200000000"}), "");
    EXPECT_THAT(player_->commands(), ElementsAre("next"));

    EXPECT_EQ(bus_.set("Rate", "d", "1.5"), "");
    EXPECT_EQ(bus_.set("Rate", "d", "0"), "");
    for (const char* rate : {"nan", "33", "0.01"})
        EXPECT_THAT(bus_.set("Rate", "d", rate), HasSubstr("Nothing is heard"));
    ASSERT_TRUE(player_->waitForCommands(3));
    EXPECT_THAT(player_->commands(), ElementsAre("next", "rate 1.50", "pause"));
    player_->tell(playing(0));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus");
    EXPECT_THAT(bus_.set("Rate", "d", "2"), HasSubstr("Nothing plays"));
}

TEST_F(MediaPlayerTest, AnAnswerTellsWhatCameOfTheCommand) {
    bringPlayer();
    EXPECT_EQ(bus_.call({"Play"}), "");
    player_->answerWith(RemoteCommandResult::noSuchContent);
    EXPECT_THAT(bus_.call({"Next"}), HasSubstr("nothing more to play"));
    player_->answerWith(RemoteCommandResult::commandFailed);
    EXPECT_THAT(bus_.call({"Stop"}), HasSubstr("could not"));
    EXPECT_EQ(bus_.call({"Previous"}), "");
    EXPECT_THAT(bus_.call({"OpenUri", "s", "file:///etc/passwd"}),
                HasSubstr("given its files by its own clients"));
    auto last = playing(0);
    last.hasNextItem = false;
    player_->tell(last);
    EXPECT_EQ(listener_.next(), "Player: CanGoNext");
    EXPECT_EQ(bus_.call({"Next"}), "");
    EXPECT_THAT(player_->commands(), ElementsAre("play", "next", "pause"));
}

TEST(RemoteCommandThreadTest, AFloodOfCommandsIsRefused) {
    BusLoop loop;
    RemoteTargets targets;
    const auto player = FakePlayer::make(targets);
    player->hold();
    RemoteCommandThread thread(loop);
    const auto pause = [&] { return targets.deliver(RemoteCommandKind::pause); };
    ASSERT_TRUE(thread.deliver(pause, nullptr));
    ASSERT_TRUE(player->waitForCommands(1));
    for (std::size_t count = 0; count < RemoteCommandThread::limit; ++count)
        ASSERT_TRUE(thread.deliver(pause, nullptr));
    EXPECT_FALSE(thread.deliver(pause, nullptr));
    player->letGo();
    EXPECT_TRUE(player->waitForCommands(2));
}

} // namespace
} // namespace tarn
