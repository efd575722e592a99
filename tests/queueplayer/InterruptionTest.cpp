#include <gtest/gtest.h>

#include "platform/AudioSession.h"
#include "platform/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;

class InterruptionTest : public ClientStory {
protected:
    InterruptionTest() { mirror({"a", "b"}); }

    /// Posts an interruption with this information as the session does.
    std::string interrupt(std::map<std::string, std::uint64_t, std::less<>> info) {
        device.audioSession.post(std::move(info));
        return now();
    }
    std::string began() { return interrupt({{AudioSession::interruptionTypeKey, 1}}); }
    std::string ended(std::uint64_t options) {
        return interrupt(
            {{AudioSession::interruptionTypeKey, 0}, {AudioSession::interruptionOptionsKey, options}});
    }
};

TEST_F(InterruptionTest, PlaysOnAfterOneThatSaysSoWithoutActivatingAgain) {
    tell(setRate("player", 2));
    auto activations = device.audioSession.activations();
    EXPECT_EQ(began(), "push queuePlayer.setRate identifier=player rate=0\n");
    EXPECT_EQ(ended(AudioSession::optionShouldResume), "push queuePlayer.setRate identifier=player rate=2\n");
    EXPECT_EQ(device.audioSession.activations(), activations);
}

TEST_F(InterruptionTest, StaysPausedAfterOneThatDoesNotSayExactlyThat) {
    tell(setRate("player", 1));
    began();
    EXPECT_EQ(ended(0), "");
    EXPECT_EQ(ended(3), "");
    EXPECT_EQ(interrupt({{AudioSession::interruptionTypeKey, 0}}), "");
    EXPECT_EQ(interrupt({{AudioSession::interruptionOptionsKey, 1}}), "");
    EXPECT_EQ(interrupt({{AudioSession::interruptionTypeKey, 7}, {AudioSession::interruptionOptionsKey, 1}}),
              "");
}

TEST_F(InterruptionTest, EveryQueuePlayerIsToldToPlayAlsoOneThatWasPaused) {
    tell(upsertPlayer("other", {"b"}));
    EXPECT_EQ(ended(AudioSession::optionShouldResume), "push queuePlayer.setRate identifier=player rate=1\n"
                                                       "push queuePlayer.setRate identifier=other rate=1\n");
    tell(destroyPlayer("player"));
    tell(setRate("other", 0));
    EXPECT_EQ(ended(AudioSession::optionShouldResume), "push queuePlayer.setRate identifier=other rate=1\n");
}

} // namespace
} // namespace tarn
