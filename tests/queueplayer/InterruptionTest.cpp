#include <gtest/gtest.h>

#include "roles/AudioSession.h"
#include "roles/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;

class InterruptionTest : public ClientStory {
protected:
    InterruptionTest() { mirror({"a", "b"}); }

    Notification notification(std::map<std::string, std::uint64_t, std::less<>> info) {
        return {AudioSession::interruptionNotification, static_cast<AudioSession*>(&device.audioSession),
                std::move(info)};
    }
    std::string began() {
        device.audioSession.beginInterruption();
        return now();
    }
    std::string ended(std::optional<std::uint64_t> options) {
        device.audioSession.endInterruption(options);
        return now();
    }
};

TEST_F(InterruptionTest, PlaysOnAfterOneThatSaysSoWithoutActivatingAgain) {
    tell(setRate("player", 2));
    auto activations = device.audioSession.activationRequests();
    EXPECT_EQ(began(), "push queuePlayer.setRate identifier=player rate=0\n");
    EXPECT_EQ(ended(AudioSession::optionShouldResume), "push queuePlayer.setRate identifier=player rate=2\n");
    EXPECT_EQ(device.audioSession.activationRequests(), activations);
}

TEST_F(InterruptionTest, StaysPausedAfterOneThatDoesNotSayExactlyThat) {
    tell(setRate("player", 1));
    began();
    EXPECT_EQ(ended(0), "");
    EXPECT_EQ(ended(3), "");
    EXPECT_EQ(ended(std::nullopt), "");

    // Nor after a notification without a type, of a type that is not known, or of a begin.
    for (const Notification& odd :
         {notification({{AudioSession::interruptionOptionsKey, 1}}),
          notification({{AudioSession::interruptionTypeKey, AudioSession::interruptionBegan},
                        {AudioSession::interruptionOptionsKey, 1}}),
          notification({{AudioSession::interruptionTypeKey, 7}, {AudioSession::interruptionOptionsKey, 1}})})
        device.notifications.post(odd);
    EXPECT_EQ(now(), "");
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
