#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <exception>
#include <new>
#include <set>
#include <string>
#include <utility>

#include "proto/AudioFilePlayerMessage.h"
#include "proto/VelmoMessage.h"
#include "tests/service/World.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"
#include "threads/LiveObjects.h"
#include "threads/WorkerQueues.h"

namespace {

/// How many allocations of this thread go well until one does not; none fails while this is negative.
thread_local long allocationsLeft = -1;
bool wasReached = false;

} // namespace

// Not inlined: seeing only one half of a pair, the compiler would warn that memory is freed in the wrong way.
[[gnu::noinline]] void* operator new(std::size_t size) {
    if (allocationsLeft >= 0 && allocationsLeft-- == 0)
        throw std::bad_alloc();
    if (void* memory = std::malloc(size > 0 ? size : 1))
        return memory;
    throw std::bad_alloc();
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

namespace tarn {
namespace {

using namespace commands;

/// How a process ends in which one allocation failed.
enum Ending : int {
    served = 0,         // as if nothing had failed
    refused = 10,       // the client has an error as the answer, and the next command is served
    ended = 11,         // the process ended by itself, for the service manager to start it again
    wrongAnswer = 12,   // anything else that the client saw
    somethingLeft = 13, // objects live on after the client has gone
    unreached = 14      // the command takes fewer allocations
};

/// A command and what it needs.
struct Story {
    const char* name;
    std::vector<Command> before;
    Command command;
};

const Command asset = upsertAsset({.identifier = "a", .URL = "file:///a"});
const Command item = upsertItem("a", "a");
const Command player = upsertPlayer("player", {"a"});

const Story stories[] = {
    {"upsertAsset", {}, asset},
    {"updateAsset", {asset}, upsertAsset({.identifier = "a", .title = "title"})},
    {"destroyAsset", {asset}, destroyAsset("a")},
    {"upsertItem", {asset}, item},
    {"destroyItem", {asset, item}, destroyItem("a")},
    {"getCurrentTime", {asset, item}, getCurrentTime("a")},
    {"setCurrentTime", {asset, item}, setCurrentTime("a", 1)},
    {"upsertPlayer", {asset, item}, player},
    {"destroyPlayer", {asset, item, player}, destroyPlayer("player")},
    {"setRate", {asset, item, player}, setRate("player", 1)},
    {"replaceCurrentItem", {asset, item, player}, replaceCurrentItem("player", "a")},
    {"advanceToNextItem", {asset, item, player}, advanceToNextItem("player")},
    {"appendItem", {asset, item, player}, appendItem("player", "a")},
    {"removeItem", {asset, item, player}, removeItem("player", "a")},
    {"removeAllItems", {asset, item, player}, removeAllItems("player")},
    {"getCurrentTimeOfNothing", {}, getCurrentTime("unknown")},
};

Data encoded(const Command& command) {
    VLProtoVelmoMessage envelope;
    envelope.setAudioFilePlayerMessage(command);
    return envelope.serialize();
}

class SilentLog final : public LogSink {
public:
    void write(const LogRecord&) override {}
};

/// Plays the story with the allocation of that number failing while its last command is served, from its
/// bytes to what the client is sent. Returns what the client saw of it.
std::vector<std::string> play(const Story& story, long failing) {
    SimulatedPlatform device(1);
    device.media.addFile("file:///a", {.title = "title"});
    auto service = std::make_shared<VLLongFormAudioServer>(device.roles());
    service->run();
    SimulatedClient client(device.listeners);
    for (const auto& command : story.before)
        client.call(encoded(command));
    device.scheduler.runReady();
    const std::size_t seenBefore = client.transcript().size();

    client.call(encoded(story.command));
    allocationsLeft = failing;
    device.scheduler.runReady();
    wasReached = std::exchange(allocationsLeft, -1) < 0;
    auto seen = client.transcript();
    seen.erase(seen.begin(), seen.begin() + static_cast<std::ptrdiff_t>(seenBefore));

    const std::uint64_t next = client.call(encoded(getCurrentTime("nothing")));
    device.scheduler.runReady();
    seen.push_back("then " + client.outcome(next));
    return seen;
}

Ending endingOf(const Story& story, long failing, const std::vector<std::string>& expected) {
    auto seen = play(story, failing);
    for (const auto& [kind, count] : LiveObjects::counts())
        if (count != 0)
            return somethingLeft;
    if (!wasReached)
        return unreached;
    if (seen == expected)
        return served;
    const std::string call = std::to_string(story.before.size() + 1);
    return seen == std::vector<std::string>{call + ": error 24", expected.back()} ? refused : wrongAnswer;
}

/// The ending in a process of its own, which an alarm ends if it hangs.
int endingInChild(const Story& story, long failing, const std::vector<std::string>& expected) {
    const pid_t child = ::fork();
    if (child == 0) {
        ::alarm(60);
        std::set_terminate([] { ::_exit(ended); });
        ::_exit(endingOf(story, failing, expected));
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

class AllocationFailureTest : public testing::TestWithParam<Story> {};

// Routing answers with an error where it allocates at all, all other work ends the process: a half-made
// change that goes on would be worse than a new start.
TEST_P(AllocationFailureTest, IsAnsweredWithAnErrorOrEndsTheProcess) {
    SystemLog::setSink(std::make_shared<SilentLog>());
    play(GetParam(), -1); // what is made once for the process is made now
    const auto expected = play(GetParam(), -1);
    std::set<int> endings;
    for (long failing = 0; !endings.contains(unreached); ++failing) {
        const int ending = endingInChild(GetParam(), failing, expected);
        ASSERT_THAT(ending, testing::AnyOf(served, refused, ended, unreached)) << "allocation " << failing;
        endings.insert(ending);
    }
    EXPECT_THAT(endings, testing::Contains(ended));
}

INSTANTIATE_TEST_SUITE_P(EveryCommand, AllocationFailureTest, testing::ValuesIn(stories),
                         [](const auto& story) { return std::string(story.param.name); });

TEST(WorkerQueueTest, WorkThatCannotBeNotedDownIsRefusedAndNoOtherIsLost) {
    WorkerQueues queues;
    auto queue = queues.create("test.queue");
    int accepted = 0;
    int ran = 0; // touched on the queue only
    int refused = 0;
    for (long failing = 0; failing < 100; ++failing) {
        allocationsLeft = failing;
        try {
            for (int i = 0; i < 20; ++i, ++accepted)
                queue->async([&] { ++ran; });
        } catch (const std::bad_alloc&) {
            ++refused;
        }
        allocationsLeft = -1;
    }
    queue->sync([&] { EXPECT_EQ(ran, accepted); });
    EXPECT_GT(refused, 0);
}

} // namespace
} // namespace tarn
