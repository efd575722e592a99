#include <gmock/gmock.h>

#include <limits>

#include "roles/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

const char timedOut[] = "Timed out waiting for response from activateWithOptions:completionHandler:";

/// Rates, and the audio session that comes before them.
class ActivationTest : public ClientStory {
protected:
    ActivationTest() { mirror({"a"}); }

    float rate() { return client->players->queuePlayerWithIdentifier("player")->rate(); }
};

TEST_F(ActivationTest, ARateThatCountsAsZeroPausesWithoutTheSession) {
    for (float rate : {0.0F, -0.0F, 1e-8F, -1e-8F, std::numeric_limits<float>::denorm_min()}) {
        tell(setRate("player", 2));
        auto activations = device.audioSession.activationRequests();
        EXPECT_EQ(tell(setRate("player", rate)), "push queuePlayer.setRate identifier=player rate=0\n"
                                                 "setRate: no answer\n");
        EXPECT_EQ(device.audioSession.activationRequests(), activations);
    }
}

TEST_F(ActivationTest, AnyOtherRateIsAppliedExactlyOnceTheSessionIsActive) {
    tell(setCurrentTime("a", 5));
    for (float rate : {1.0F, 2.0F, -1.0F, 1.1920929e-07F, 0.333F}) {
        tell(setRate("player", rate));
        EXPECT_EQ(this->rate(), rate);
        EXPECT_EQ(device.audioSession.activationOptions(), 0u);
    }
    tell(removeAllItems("player"));
    tell(setRate("player", 3));
    EXPECT_EQ(rate(), 3);
}

TEST_F(ActivationTest, AFailedActivationLeavesTheRateAndSaysWhy) {
    device.audioSession.willActivate({.error = Error{"test", 7, {}}});
    EXPECT_EQ(tell(setRate("player", 1)),
              "push queuePlayer.setStatus errorCode=7 errorDomain=test identifier=player status=1\n"
              "setRate: no answer\n");
    EXPECT_EQ(rate(), 0);
    EXPECT_THAT(errors(), ElementsAre("Could not set audio session active due to error: (test, code 7)."));
}

TEST_F(ActivationTest, LaterCommandsOfItsQueueWaitForTheSessionAndItemCommandsDoNot) {
    device.audioSession.willActivate({.after = 5s});
    device.audioSession.willActivate({.after = 5s});
    client->send(setRate("player", 1));
    client->send(setRate("player", 2));
    EXPECT_EQ(tell(getCurrentTime("a")), "getCurrentTime: currentTime=0\n");
    EXPECT_EQ(pass(5s), "push queuePlayer.setRate identifier=player rate=1\n"
                        "setRate: no answer\n");
    EXPECT_EQ(pass(5s), "push queuePlayer.setRate identifier=player rate=2\n"
                        "setRate: no answer\n");
}

TEST_F(ActivationTest, AnAnswerWithin17SecondsIsInTime) {
    device.audioSession.willActivate({.after = 16'999ms});
    EXPECT_EQ(tell(setRate("player", 1)), "");
    EXPECT_EQ(pass(16'999ms), "push queuePlayer.setRate identifier=player rate=1\n"
                              "setRate: no answer\n");
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(ActivationTest, After17SecondsTheQueueGoesOnAndALateSuccessIsStillApplied) {
    device.audioSession.willActivate({.after = 20s});
    tell(setRate("player", 1));
    EXPECT_EQ(pass(16'999ms), "");
    EXPECT_EQ(pass(1ms), "setRate: no answer\n");
    EXPECT_THAT(errors(), ElementsAre(timedOut));

    // Also when the client has paused meanwhile.
    tell(setRate("player", 0));
    EXPECT_EQ(pass(3s), "push queuePlayer.setRate identifier=player rate=1\n");
}

TEST_F(ActivationTest, ALateFailureIsLogged) {
    device.audioSession.willActivate({.after = 20s, .error = Error{"test", 7, {}}});
    tell(setRate("player", 1));
    pass(20s);
    EXPECT_EQ(rate(), 0);
    EXPECT_THAT(errors(), ElementsAre(timedOut, HasSubstr("code 7")));
}

TEST_F(ActivationTest, APendingActivationKeepsAQueuePlayerAndNothingElseDoes) {
    device.audioSession.willActivate({.after = 30s});
    tell(setRate("player", 1));
    EXPECT_EQ(pass(17s), "setRate: no answer\n");
    tell(destroyPlayer("player"));
    EXPECT_EQ(LiveObjects::counts()["queue player"], 1);
    client.reset();
    EXPECT_EQ(LiveObjects::counts()["object manager"], 2) << "those that the queue player was made with";
    device.scheduler.advance(13s);
    EXPECT_EQ(LiveObjects::counts()["queue player"], 0);
    EXPECT_EQ(LiveObjects::counts()["object manager"], 0);
}

} // namespace
} // namespace tarn
