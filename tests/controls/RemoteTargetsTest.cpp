#include "controls/RemoteTargets.h"

#include <thread>

#include <gmock/gmock.h>

#include "tests/controls/FakePlayer.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class RemoteTargetsTest : public testing::Test {
protected:
    PlaybackState playback(float rate) const { return {.rate = rate, .item = item_}; }

    const std::shared_ptr<MediaItem> item_ = std::make_shared<FakeItem>();
    int changes_ = 0;
    RemoteTargets targets_{[this] { ++changes_; }};
};

TEST_F(RemoteTargetsTest, CommandsGoToWhatPlaysAndToNobodyElse) {
    const auto album = FakePlayer::make(targets_, playback(1.5F));
    const auto book = FakePlayer::make(targets_, playback(0));
    album->answerWith(RemoteCommandResult::noSuchContent);
    EXPECT_EQ(targets_.deliver(RemoteCommandKind::nextTrack), RemoteCommandResult::noSuchContent);
    targets_.deliver(RemoteCommandKind::play);
    EXPECT_THAT(album->commands(), ElementsAre("next", "play"));
    EXPECT_THAT(book->commands(), IsEmpty());
}

TEST_F(RemoteTargetsTest, WhileNothingPlaysTheyGoToWhatWasUsedLast) {
    const auto album = FakePlayer::make(targets_, playback(0));
    const auto book = FakePlayer::make(targets_, playback(0));
    const auto empty = FakePlayer::make(targets_);
    targets_.deliver(RemoteCommandKind::togglePlayPause);
    EXPECT_THAT(book->commands(), ElementsAre("toggle")) << "the newest one that has an item";

    album->tell({.rate = 0, .item = item_, .seeks = 1});
    targets_.deliver(RemoteCommandKind::nextTrack);
    EXPECT_THAT(book->commands(), ElementsAre("toggle", "next")) << "a seek is no use of it";

    album->tell(playback(1));
    album->tell(playback(0));
    targets_.deliver(RemoteCommandKind::play);
    EXPECT_THAT(album->commands(), ElementsAre("play"));

    book->tell({.rate = 1, .isHeld = true, .item = item_}); // used last, though nothing is heard of it
    EXPECT_FALSE(targets_.players().front().playback.plays());
    targets_.deliver(RemoteCommandKind::play);
    EXPECT_THAT(book->commands(), ElementsAre("toggle", "next", "play"));
}

TEST_F(RemoteTargetsTest, AnotherRateOrItemCountsOnceItIsPublished) {
    const auto player = FakePlayer::make(targets_, playback(0));
    player->become({.rate = 1, .isHeld = {}, .item = item_, .position = {}, .hasNextItem = {}, .seeks = 1});
    targets_.playbackChanged(*player);
    EXPECT_EQ(targets_.players().front().playback.seeks, 0U);
    targets_.playerChanged(*player);
    EXPECT_EQ(targets_.players().front().playback.rate, 1);
    player->become({.rate = 1, .isHeld = {}, .item = item_, .position = {}, .hasNextItem = {}, .seeks = 2});
    targets_.playbackChanged(*player);
    EXPECT_EQ(targets_.players().front().playback.seeks, 2U);
}

TEST_F(RemoteTargetsTest, APauseReachesEverybodyAndTheOneUsedLastComesLast) {
    const auto album = FakePlayer::make(targets_, playback(1));
    const auto book = FakePlayer::make(targets_, playback(1));
    album->answerWith(RemoteCommandResult::commandFailed);
    EXPECT_EQ(targets_.deliver(RemoteCommandKind::pause), RemoteCommandResult::success);
    EXPECT_EQ(targets_.deliver(RemoteCommandKind::togglePlayPause), RemoteCommandResult::success);
    EXPECT_THAT(album->commands(), ElementsAre("pause", "pause"));
    EXPECT_THAT(book->commands(), ElementsAre("pause", "pause"));
    book->answerWith(RemoteCommandResult::commandFailed);
    EXPECT_EQ(targets_.deliver(RemoteCommandKind::pause), RemoteCommandResult::commandFailed);
}

TEST(RemoteTargetsThreads, PlayersComeAndGoWhileCommandsAreDelivered) {
    constexpr int rounds = 2000;
    RemoteTargets targets;
    const auto permanent = FakePlayer::make(targets);
    PlaybackState playing;
    playing.rate = 1;
    std::thread coming([&] {
        for (int round = 0; round < rounds; ++round)
            FakePlayer::make(targets)->tell(playing);
    });
    for (int round = 0; round < rounds; ++round)
        ASSERT_EQ(targets.deliver(RemoteCommandKind::pause), RemoteCommandResult::success);
    coming.join();
}

} // namespace
} // namespace tarn
