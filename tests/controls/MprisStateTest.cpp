#include "controls/MprisState.h"

#include <cmath>
#include <limits>

#include <gmock/gmock.h>

#include "controls/RemoteTargets.h"
#include "tests/controls/FakePlayer.h"

namespace tarn {
namespace {

using std::chrono::seconds;
using testing::Optional;

const ApplicationLabel musicBox{"Music Box", "org.example.MusicBox"};

NowPlayingInfo record(const std::string& title) {
    return {.title = title,
            .duration = 180.0,
            .elapsedTime = {},
            .playbackRate = {},
            .artist = "Someone",
            .albumTitle = "Songs"};
}

/// What is shown, told as what the listeners are told: "PlaybackStatus Metadata, Seeked 90".
class MprisStateTest : public testing::Test {
protected:
    std::string show(const NowPlayingInfo& published, const PlaybackState& playback,
                     const ApplicationLabel& application = musicBox) {
        const MprisState before = state_;
        state_ = state_.next(published, application, {player_, playback});
        const MprisChanges changes = changesBetween(before, state_);
        std::string told;
        for (const auto* names : {&changes.application, &changes.player})
            for (const std::string& name : *names)
                told += (told.empty() ? "" : " ") + name;
        if (changes.seeked)
            told += ", Seeked " + std::to_string(changes.seeked->count() / 1'000'000);
        return told;
    }

    PlaybackState first(float rate, std::int64_t position = 0, std::uint64_t seeks = 0) const {
        return {.rate = rate, .item = first_, .position = {position, 1}, .hasNextItem = true, .seeks = seeks};
    }

    RemoteTargets targets_;
    const std::shared_ptr<ControllablePlayer> player_ =
        std::make_shared<FakePlayer>(targets_, PlaybackState{});
    const std::shared_ptr<MediaItem> first_ = std::make_shared<FakeItem>();
    const std::shared_ptr<MediaItem> second_ = std::make_shared<FakeItem>();
    MprisState state_ = MprisState().next({}, musicBox, {player_, {}});
};

TEST_F(MprisStateTest, TheRateIsNeverZeroAndItsRangeHoldsWhatAClientChose) {
    show(record("A"), first(0));
    EXPECT_EQ(state_.rate, 1.0);
    EXPECT_EQ(show(record("A"), first(-1)), "PlaybackStatus Rate MinimumRate");
    EXPECT_EQ(state_.minimumRate(), -1.0);
    EXPECT_EQ(show(record("A"), first(40)), "Rate MinimumRate MaximumRate");
    EXPECT_EQ(state_.maximumRate(), 40.0);
}

TEST_F(MprisStateTest, TextsAreCleanAndShort) {
    NowPlayingInfo published = record(std::string("a\0b\nc\xff\xed\xa0\x80", 9));
    published.artist = std::string(1 << 20, 'x');
    published.albumTitle = "\xef\xbf\xbe";
    show(published, first(0));
    EXPECT_THAT(state_.track->title, Optional(std::string("a b c\ufffd\ufffd\ufffd\ufffd")));
    EXPECT_EQ(state_.track->artist->size(), 1024U);
    EXPECT_THAT(state_.track->album, Optional(std::string("\ufffd")));
}

TEST_F(MprisStateTest, AnotherItemHasANewTrackIdAndTheStatusComesWithIt) {
    show(record("A"), first(1));
    EXPECT_EQ(show(record("B"), {.rate = 1, .item = second_, .hasNextItem = true}),
              "PlaybackStatus Metadata");
    EXPECT_EQ(state_.track->path(), "/ostrel/tarnd/track/2");
    EXPECT_EQ(show(record("B"), first(1)), "PlaybackStatus Metadata") << "the same recording once more";
    EXPECT_EQ(show(record("A"), {.rate = 1, .item = second_, .position = {60, 1}, .hasNextItem = true}),
              "PlaybackStatus Metadata, Seeked 60");
    show({}, {});
    show(record("A"), first(1));
    EXPECT_EQ(state_.track->path(), "/ostrel/tarnd/track/5");
}

} // namespace
} // namespace tarn
