#include <gtest/gtest.h>

#include <atomic>
#include <random>
#include <sstream>
#include <thread>

#include "controls/RemoteTargets.h"
#include "observation/LocalNotificationCenter.h"
#include "roles/AudioSession.h"
#include "roles/NowPlayingService.h"
#include "simulated/SimulatedApplicationRegistry.h"
#include "simulated/SimulatedLocalization.h"
#include "simulated/SimulatedMediaEngine.h"
#include "simulated/SimulatedSandboxExtension.h"
#include "simulated/SimulatedServiceListeners.h"
#include "tests/player/ThreadLoop.h"
#include "tests/schedules/CommandMix.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/MirroredClient.h"
#include "threads/LiveObjects.h"
#include "threads/SteadyClock.h"
#include "threads/WorkerQueues.h"

namespace tarn {
namespace {

/// Activates on a thread of its own, sometimes with an error.
class ThreadedSession final : public AudioSession {
public:
    explicit ThreadedSession(NotificationCenter& notifications) : notifications_(notifications) {}

    std::optional<Error> setCategory(Category, Mode, RouteSharingPolicy, std::uint64_t) override {
        return {};
    }

    void activateWithOptions(std::uint64_t, ActivationCompletion completion) override {
        const bool works = ++activations_ % 5 != 0;
        thread_.post([works, completion = std::move(completion)] {
            completion(works, works ? std::nullopt : std::optional(Error{"test", 1, {}}));
        });
    }

    void interrupt() {
        thread_.post([this] {
            post({{interruptionTypeKey, interruptionBegan}});
            post({{interruptionTypeKey, interruptionEnded}, {interruptionOptionsKey, optionShouldResume}});
        });
    }

    void finish() { thread_.finish(); }

private:
    void post(std::map<std::string, std::uint64_t, std::less<>> info) {
        notifications_.post({.name = interruptionNotification, .sender = this, .info = std::move(info)});
    }

    NotificationCenter& notifications_;
    std::atomic<int> activations_ = 0;
    ThreadLoop thread_;
};

class UnseenNowPlaying final : public NowPlayingService {
public:
    void setParentApplication(Origin, const std::optional<std::string>&) override {}
    void setNowPlayingInfo(Origin, const NowPlayingInfo&, int) override {}
};

/// A device whose every thread is a real one.
struct ThreadedDevice {
    SteadyClock clock;
    WorkerQueues queues;
    SimulatedServiceListeners listeners{
        {queues.create("I/O"), [](std::size_t) { return std::size_t(0); }, [] {}}};
    SimulatedLocalization localization;
    LocalNotificationCenter notifications;
    SimulatedSandboxExtension sandboxExtensions;
    ThreadLoop playerLoop;
    SimulatedMediaEngine media{playerLoop, notifications, sandboxExtensions};
    ThreadedSession session{notifications};
    RemoteTargets remoteCommands;
    UnseenNowPlaying nowPlaying;
    SimulatedApplicationRegistry applications;

    Platform roles() {
        return {clock,          queues,     listeners,   localization,
                notifications,  media,      session,     sandboxExtensions,
                remoteCommands, nowPlaying, applications};
    }
};

std::ptrdiff_t answersIn(const std::string& transcript) {
    std::istringstream lines(transcript);
    std::ptrdiff_t answers = 0;
    for (std::string line; std::getline(lines, line);)
        answers += line.starts_with("push ") ? 0 : 1;
    return answers;
}

// What the schedules do on virtual time, for the thread sanitizer: a client commands while files of a few
// milliseconds play to their end, media keys are pressed and calls come in.
TEST(ThreadsTest, QueuePlayersAreDrivenFromAllSidesAndNothingIsLost) {
    constexpr int lives = 20;
    constexpr int commandsOfALife = 300;
    CapturedLog log;
    const auto before = LiveObjects::counts();
    {
        ThreadedDevice device;
        device.media.addFile("file:///a", {.title = "a", .duration = std::chrono::milliseconds(3)});
        device.media.addFile("file:///broken", {.duration = std::chrono::milliseconds(5),
                                                .breaksAt = std::chrono::milliseconds(1)});
        std::atomic<bool> finished = false;
        std::jthread keys([&] {
            for (int press = 0; !finished; ++press) {
                device.remoteCommands.deliver(static_cast<RemoteCommandKind>(press % 5));
                if (press % 7 == 0)
                    device.session.interrupt();
                device.playerLoop.finishPosted();
            }
        });
        std::mt19937 random(1);
        CommandMix mix([&](std::size_t limit) { return random() % limit; },
                       {"file:///a", "file:///broken", "file:///none"});
        for (int life = 0; life < lives; ++life) {
            MirroredClient client(device.roles());
            std::vector<commands::Command> commands = mix.beginning();
            for (int count = 0; count < commandsOfALife; ++count)
                commands.push_back(mix.next());
            for (const auto& command : commands)
                client.send(command);
            client.itemQueue().sync([] {});
            client.playerQueue().sync([] {});
            EXPECT_EQ(answersIn(client.transcript().take()), std::ssize(commands));
        }
        finished = true;
        keys.join();
        device.session.finish();
        device.playerLoop.finish();
    }
    for (const auto& [kind, count] : LiveObjects::counts())
        EXPECT_EQ(count, before.contains(kind) ? before.at(kind) : 0) << kind;
}

} // namespace
} // namespace tarn
