#include <gtest/gtest.h>

#include "service/LongFormAudioServer.h"
#include "simulated/SimulatedClient.h"
#include "simulated/SimulatedPlatform.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

// Of what it sent last, any part may have been handed over, begun or done when it leaves.
TEST(LeavingClientsTest, AreSilentAndForgottenWhicheverOfTheirWorkHasBegun) {
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
        const SimulatedClient next(device.listeners);
        device.scheduler.runReady();
        EXPECT_EQ(device.media.speaker().soundingOutputs(), 0u) << seed;
        device.scheduler.runUntilIdle();
        EXPECT_TRUE(next.deliveries().empty()) << seed;
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
