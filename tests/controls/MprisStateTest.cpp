#include "controls/MprisState.h"

#include <cmath>
#include <limits>

#include <gmock/gmock.h>

namespace tarn {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::UnorderedElementsAre;

const ApplicationLabel player{"Music Box", "org.example.MusicBox"};

NowPlayingInfo track(const std::string& title, double elapsed, float rate) {
    return {.title = title,
            .duration = 180.0,
            .elapsedTime = elapsed,
            .playbackRate = rate,
            .artist = "Someone",
            .albumTitle = "Songs"};
}

class MprisStateTest : public testing::Test {
protected:
    void wait(milliseconds time) { now_ += time; }

    MprisChanges publish(const NowPlayingInfo& info, const ApplicationLabel& application = player) {
        const MprisState before = state_;
        state_ = state_.next({info, now_, application});
        return changesBetween(before, state_);
    }

    std::uint64_t trackNumber() const { return state_.track.value().number; }
    double position() const { return std::chrono::duration<double>(state_.position.at(now_)).count(); }

    PositionLine::Time now_{seconds(1000)};
    MprisState state_;
};

TEST_F(MprisStateTest, WithoutATrackNothingCanBeControlled) {
    EXPECT_EQ(state_.playbackStatus, PlaybackStatus::stopped);
    EXPECT_FALSE(state_.hasTrack());

    EXPECT_THAT(publish(track("A", 0, 0)).player,
                UnorderedElementsAre("PlaybackStatus", "Metadata", "CanGoNext", "CanPlay", "CanPause"));
    EXPECT_THAT(publish({}).player,
                UnorderedElementsAre("PlaybackStatus", "Metadata", "CanGoNext", "CanPlay", "CanPause"));
    EXPECT_EQ(state_.playbackStatus, PlaybackStatus::stopped);
    EXPECT_EQ(position(), 0);
}

TEST_F(MprisStateTest, ThePositionRunsOnAtTheRateAndStopsAtTheEnds) {
    publish(track("A", 30, 1.5F));
    wait(seconds(10));
    EXPECT_DOUBLE_EQ(position(), 45);
    wait(seconds(1000));
    EXPECT_DOUBLE_EQ(position(), 180);

    publish(track("A", 20, -2.0F));
    wait(seconds(5));
    EXPECT_DOUBLE_EQ(position(), 10);
    wait(seconds(6));
    EXPECT_DOUBLE_EQ(position(), 0);

    publish(track("A", 20, 0));
    wait(seconds(5));
    EXPECT_DOUBLE_EQ(position(), 20);
}

TEST_F(MprisStateTest, PausingAndResumingOnTheLineIsNoJump) {
    publish(track("A", 0, 1));
    wait(seconds(10));
    EXPECT_EQ(publish(track("A", 9.8, 0)),
              (MprisChanges{.application = {}, .player = {"PlaybackStatus"}, .seeked = {}}));
    wait(seconds(60));
    EXPECT_EQ(publish(track("A", 9.8, 1)),
              (MprisChanges{.application = {}, .player = {"PlaybackStatus"}, .seeked = {}}));
    EXPECT_EQ(trackNumber(), 1U);
}

TEST_F(MprisStateTest, ARepeatedPublicationChangesNothing) {
    publish(track("A", 0, 0));
    wait(seconds(1));
    EXPECT_EQ(publish(track("A", 0, 0)), MprisChanges{});
}

TEST_F(MprisStateTest, APublicationOffTheLineIsAJump) {
    publish(track("A", 0, 1));
    wait(seconds(10));
    const MprisChanges changes = publish(track("A", 90, 1));
    EXPECT_THAT(changes.player, IsEmpty());
    EXPECT_THAT(changes.seeked, Optional(seconds(90)));
}

TEST_F(MprisStateTest, ARateChangeIsNoJumpAndMovesTheRange) {
    publish(track("A", 0, 1));
    wait(seconds(10));
    EXPECT_EQ(publish(track("A", 10, 2)),
              (MprisChanges{.application = {}, .player = {"Rate", "MaximumRate"}, .seeked = {}}));
    EXPECT_EQ(state_.minimumRate(), 1.0);
    EXPECT_EQ(state_.maximumRate(), 2.0);
    wait(seconds(10));
    EXPECT_EQ(publish(track("A", 30, 2)), MprisChanges{});
}

TEST_F(MprisStateTest, TheRateIsNeverZeroAndPlayRunsAtOne) {
    publish(track("A", 0, 2));
    publish(track("A", 0, 0));
    EXPECT_EQ(state_.rate, 1.0);
    publish(track("A", 0, 1e-8F));
    EXPECT_EQ(state_.playbackStatus, PlaybackStatus::paused);
    publish(track("A", 0, -1));
    EXPECT_EQ(state_.rate, -1.0);
    EXPECT_EQ(state_.minimumRate(), -1.0);
    EXPECT_EQ(state_.maximumRate(), 1.0);
}

TEST_F(MprisStateTest, AnotherItemHasANewTrackIdAndTheStatusComesWithIt) {
    publish(track("A", 0, 1));
    wait(seconds(180));
    const MprisChanges changes = publish(track("B", 0.1, 1));
    EXPECT_EQ(changes,
              (MprisChanges{.application = {}, .player = {"PlaybackStatus", "Metadata"}, .seeked = {}}));
    EXPECT_EQ(trackNumber(), 2U);
    publish(track("A", 0, 1));
    EXPECT_EQ(trackNumber(), 3U);
    publish({});
    publish(track("A", 0, 1));
    EXPECT_EQ(trackNumber(), 4U);
}

TEST_F(MprisStateTest, TheSameRecordingFromItsStartIsAnotherItem) {
    publish(track("A", 0, 1));
    wait(seconds(180));
    EXPECT_EQ(publish(track("A", 0, 1)),
              (MprisChanges{.application = {}, .player = {"PlaybackStatus", "Metadata"}, .seeked = {}}));
    EXPECT_EQ(trackNumber(), 2U);
    wait(milliseconds(900));
    publish(track("A", 0.2, 0)); // too early to have begun again
    EXPECT_EQ(trackNumber(), 2U);
}

TEST_F(MprisStateTest, AnItemThatBeginsInTheMiddleJumpsThere) {
    publish(track("A", 0, 1));
    EXPECT_THAT(publish(track("B", 60, 1)).seeked, Optional(seconds(60)));
}

TEST_F(MprisStateTest, AnotherApplicationIsShownBeforeItsTrack) {
    publish(track("A", 10, 0));
    const MprisChanges changes = publish(track("A", 10, 0), {"Radio", ""});
    EXPECT_THAT(changes.application, ElementsAre("Identity", "DesktopEntry"));
    EXPECT_THAT(changes.player, ElementsAre("PlaybackStatus", "Metadata"));
}

TEST_F(MprisStateTest, NumbersThatAreNoTimesAreLeftOut) {
    for (const double odd : {std::nan(""), -1.0, 0.0, -std::numeric_limits<double>::infinity()}) {
        publish({.title = "A",
                 .duration = odd,
                 .elapsedTime = odd,
                 .playbackRate = std::nanf(""),
                 .artist = {},
                 .albumTitle = {}});
        EXPECT_EQ(state_.track.value().length, std::nullopt);
        EXPECT_EQ(position(), 0);
        EXPECT_EQ(state_.playbackStatus, PlaybackStatus::paused);
    }
    const double infinite = std::numeric_limits<double>::infinity();
    publish({.title = "A",
             .duration = infinite,
             .elapsedTime = infinite,
             .playbackRate = std::numeric_limits<float>::max(),
             .artist = {},
             .albumTitle = {}});
    wait(seconds(100));
    EXPECT_GT(position(), 1e8);
}

TEST_F(MprisStateTest, TextsAreCleanAndShort) {
    publish({.title = std::string("a\0b\nc\xff\xed\xa0\x80", 9),
             .duration = {},
             .elapsedTime = {},
             .playbackRate = {},
             .artist = std::string(1 << 20, 'x'),
             .albumTitle = std::string("\xef\xbf\xbe")});
    EXPECT_THAT(state_.track.value().title, Optional(std::string("a b c\ufffd\ufffd\ufffd\ufffd")));
    EXPECT_EQ(state_.track.value().artist.value().size(), 1024U);
    EXPECT_THAT(state_.track.value().album, Optional(std::string("\ufffd")));
}

} // namespace
} // namespace tarn
