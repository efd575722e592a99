#include <gtest/gtest.h>

#include "roles/AudioSession.h"
#include "service/LongFormAudioServer.h"
#include "simulated/SimulatedClient.h"
#include "simulated/SimulatedPlatform.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

/// One of two queue players sounds, and a rate of one of them waits for the audio session, when their client
/// leaves.
class LeavingClientTest : public testing::TestWithParam<const char*> {
protected:
    LeavingClientTest() {
        service->run();
        device.media.addFile("file:///a");
        device.media.speaker().listen();
        client = std::make_unique<SimulatedClient>(device.listeners);
        send(commands::upsertAsset({.identifier = "a", .URL = "file:///a"}));
        send(commands::upsertItem("a", "a"));
        send(commands::upsertPlayer("sounding", {"a"}));
        send(commands::upsertPlayer("other", {}));
        send(commands::setRate("sounding", 1));
        device.scheduler.advance(2s);
        EXPECT_EQ(device.media.speaker().soundingOutputs(), 1u);
    }

    void send(const commands::Command& command) {
        client->send(commands::encoded(command));
        device.scheduler.runReady();
    }

    CapturedLog log;
    SimulatedPlatform device{1};
    const std::shared_ptr<VLLongFormAudioServer> service =
        std::make_shared<VLLongFormAudioServer>(device.roles());
    std::unique_ptr<SimulatedClient> client;
};

TEST_P(LeavingClientTest, IsSilentAtOnceAndStaysSo) {
    for (auto after : {10s, 0s, 10s})
        device.audioSession.willActivate({.after = after});
    send(commands::setRate(GetParam(), 2));
    // What waits behind it is not heard either.
    send(commands::upsertPlayer("late", {"a"}));
    send(commands::setRate("late", 1));
    send(commands::setRate("late", 2));
    client->hangUp();
    device.scheduler.runReady();
    EXPECT_EQ(device.media.speaker().soundingOutputs(), 0u);
    device.audioSession.endInterruption(AudioSession::optionShouldResume);
    device.scheduler.runUntilIdle();
    ASSERT_EQ(device.media.speaker().heard().size(), 1u);
    EXPECT_EQ(device.media.speaker().heard().front().text(), "0.000-2.000 file:///a 0.000..2.000");
    EXPECT_EQ(device.media.speaker().outputs(), 0u);
}

TEST_P(LeavingClientTest, IsNotHeardOfByTheNextOne) {
    device.audioSession.willActivate({.after = 10s});
    send(commands::setRate(GetParam(), 2));
    // What waits behind it makes objects for nobody.
    send(commands::upsertPlayer("late", {"a"}));
    client->hangUp();
    SimulatedClient next(device.listeners);
    device.scheduler.runUntilIdle();
    EXPECT_TRUE(next.deliveries().empty());
}

INSTANTIATE_TEST_SUITE_P(TheRateThatWaits, LeavingClientTest, testing::Values("sounding", "other"));

// Of what it sent last, any part may have been handed over, begun or done when it leaves.
TEST(LeavingClientsTest, AreSilentWhicheverOfTheirWorkHasBegun) {
    CapturedLog log;
    for (std::uint64_t seed = 1; seed <= 500; ++seed) {
        SimulatedPlatform device(seed);
        device.media.addFile("file:///a");
        auto service = std::make_shared<VLLongFormAudioServer>(device.roles());
        service->run();
        SimulatedClient client(device.listeners);
        for (const auto& command : {commands::upsertAsset({.identifier = "a", .URL = "file:///a"}),
                                    commands::upsertItem("a", "a")}) {
            client.send(commands::encoded(command));
            device.scheduler.runReady();
        }
        device.audioSession.willActivate({});
        device.audioSession.willActivate({.after = 10s});
        for (const auto& command :
             {commands::upsertPlayer("p", {"a"}), commands::setRate("p", 1), commands::setRate("p", 2)})
            client.send(commands::encoded(command));
        client.hangUp();
        device.scheduler.runReady();
        EXPECT_EQ(device.media.speaker().soundingOutputs(), 0u) << seed;
    }
}

// Rates and jumps are under way when it is replaced, on the queues and on the player thread.
TEST(LeavingClientsTest, AreNotHeardOfByTheNextOneWhateverTheyAreAboutToReport) {
    CapturedLog log;
    for (std::uint64_t seed = 1; seed <= 500; ++seed) {
        SimulatedPlatform device(seed);
        device.media.addFile("file:///a");
        auto service = std::make_shared<VLLongFormAudioServer>(device.roles());
        service->run();
        SimulatedClient first(device.listeners);
        for (const auto& command : {commands::upsertAsset({.identifier = "a", .URL = "file:///a"}),
                                    commands::upsertItem("a", "a"), commands::upsertPlayer("p", {"a"})}) {
            first.send(commands::encoded(command));
            device.scheduler.runReady();
        }
        for (int rate = 1; rate <= 3; ++rate) {
            first.send(commands::encoded(commands::setRate("p", static_cast<float>(rate))));
            first.send(commands::encoded(commands::setCurrentTime("a", rate)));
        }
        SimulatedClient next(device.listeners);
        device.scheduler.runReady();
        EXPECT_TRUE(next.deliveries().empty()) << seed;
    }
}

} // namespace
} // namespace tarn
