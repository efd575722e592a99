#include <gtest/gtest.h>

#include <optional>

#include "roles/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;
using Kind = RemoteCommandKind;
using Result = RemoteCommandResult;

class RemoteCommandTest : public ClientStory {
protected:
    RemoteCommandTest() { mirror({"a", "b"}); }

    /// Delivers the command as the system does; none while it is not finished.
    std::optional<Result> press(Kind kind) {
        std::size_t before = device.remoteCommands.results().size();
        device.remoteCommands.press(kind);
        seen = now();
        const auto& results = device.remoteCommands.results();
        return results.size() > before ? std::optional(results.back()) : std::nullopt;
    }

    std::string seen;
};

TEST_F(RemoteCommandTest, PlayPauseAndToggleDoWhatTheySay) {
    EXPECT_EQ(press(Kind::play), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setRate identifier=player rate=1\n");
    EXPECT_EQ(press(Kind::pause), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setRate identifier=player rate=0\n");
    EXPECT_EQ(press(Kind::togglePlayPause), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setRate identifier=player rate=1\n");
    tell(setCurrentTime("a", 5));
    tell(setRate("player", -1));
    EXPECT_EQ(press(Kind::togglePlayPause), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setRate identifier=player rate=0\n");
    // A rate that counts as zero is no playing.
    client->players->queuePlayerWithIdentifier("player")->setRate(1e-8F);
    now();
    EXPECT_EQ(press(Kind::togglePlayPause), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setRate identifier=player rate=1\n");
}

TEST_F(RemoteCommandTest, FailWhereThereIsNothingToPauseOrTheSessionFails) {
    tell(removeAllItems("player"));
    EXPECT_EQ(press(Kind::pause), Result::commandFailed);
    for (int activation = 0; activation < 2; ++activation)
        device.audioSession.willActivate({.error = Error{"test", 1, {}}});
    EXPECT_EQ(press(Kind::play), Result::commandFailed);
    EXPECT_EQ(press(Kind::togglePlayPause), Result::commandFailed);
    device.audioSession.willActivate({.after = 20s});
    EXPECT_EQ(press(Kind::play), std::nullopt);
    pass(17s);
    EXPECT_EQ(device.remoteCommands.results().back(), Result::commandFailed);
}

TEST_F(RemoteCommandTest, NextTrackHasNoContentAtTheEndOfTheQueue) {
    EXPECT_EQ(press(Kind::nextTrack), Result::success);
    EXPECT_EQ(seen, "push queuePlayer.setCurrentItem containedIdentifier=b identifier=player\n");
    EXPECT_EQ(press(Kind::nextTrack), Result::noSuchContent);
    EXPECT_EQ(seen, "push queuePlayer.setCurrentItem identifier=player\n");
}

TEST_F(RemoteCommandTest, PreviousTrackIsDisabledForGood) {
    RemoteTargets& center = device.remoteCommands.center();
    auto someone = center.previousTrackCommand().addTarget(*center.players().front().player,
                                                           [] { return Result::success; });
    EXPECT_EQ(press(Kind::previousTrack), Result::noSuchContent);
    tell(destroyPlayer("player"));
    EXPECT_EQ(press(Kind::previousTrack), Result::noSuchContent);
}

TEST_F(RemoteCommandTest, APlayThatWaitsForTheSessionHoldsUpNobodyElse) {
    device.audioSession.willActivate({.after = 20s});
    EXPECT_EQ(press(Kind::play), std::nullopt);
    EXPECT_EQ(tell(advanceToNextItem("player")),
              "push queuePlayer.setCurrentItem containedIdentifier=b identifier=player\n"
              "advanceToNextItem: no answer\n");
    EXPECT_EQ(pass(17s), "");
    EXPECT_EQ(errors().size(), 1u);
    EXPECT_EQ(pass(3s), "push queuePlayer.setRate identifier=player rate=1\n");
}

} // namespace
} // namespace tarn
