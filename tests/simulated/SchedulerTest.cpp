#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>
#include <string>

#include "simulated/SimulatedClock.h"
#include "simulated/SimulatedQueues.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

/// What three queues that submit and wait across each other write down, in the order of one seed.
std::string transcriptOf(std::uint64_t seed) {
    std::string transcript;
    SimulatedScheduler scheduler(seed);
    auto guard = scheduler.createQueue("guard");
    for (char name : {'a', 'b', 'c'}) {
        auto queue = scheduler.createQueue(std::string(1, name));
        for (char step : {'1', '2', '3'})
            queue->async([&transcript, guard, name, step] {
                guard->sync([&] { transcript += {name, step, ' '}; });
            });
    }
    scheduler.runReady();
    return transcript;
}

TEST(SchedulerTest, ASeedIsOneInterleavingAndManySeedsAreManyInOrderPerQueue) {
    std::set<std::string> transcripts;
    for (std::uint64_t seed = 0; seed < 300; ++seed) {
        auto transcript = transcriptOf(seed);
        EXPECT_EQ(transcript, transcriptOf(seed));
        for (std::string name : {"a", "b", "c"}) {
            EXPECT_LT(transcript.find(name + "1"), transcript.find(name + "2"));
            EXPECT_LT(transcript.find(name + "2"), transcript.find(name + "3"));
        }
        transcripts.insert(transcript);
    }
    EXPECT_GT(transcripts.size(), 200u);
}

TEST(SchedulerTest, SyncWaitsForEarlierWorkAlsoAcrossATimedWait) {
    SimulatedScheduler scheduler(1);
    SimulatedClock clock(scheduler);
    auto slow = scheduler.createQueue("slow");
    auto waiting = scheduler.createQueue("waiting");
    std::string order;
    slow->async([&] {
        EXPECT_FALSE(clock.makeSignal()->wait(17s));
        order += "slow ";
    });
    slow->async([&] { order += "later "; });
    waiting->async([&] { slow->sync([&] { order += "sync"; }); });
    scheduler.advance(16999ms);
    EXPECT_EQ(order, "");
    scheduler.advance(1ms);
    EXPECT_THAT(order, testing::StartsWith("slow "));
    EXPECT_THAT(order, testing::HasSubstr("sync"));
    EXPECT_EQ(scheduler.now(), 17s);
}

TEST(SchedulerDeathTest, WaitingInACircleIsReportedWithTheQueues) {
    testing::GTEST_FLAG(death_test_style) = "threadsafe";
    auto circle = [] {
        for (std::uint64_t seed = 0;; ++seed) {
            SimulatedScheduler scheduler(seed);
            auto one = scheduler.createQueue("test.one");
            auto other = scheduler.createQueue("test.other");
            one->async([&] { other->sync([] {}); });
            other->async([&] { one->sync([] {}); });
            scheduler.runReady();
        }
    };
    EXPECT_DEATH(circle(), "work of \"test.*\"\n  waits for \"test.*\"\n  work of");
    auto self = [] {
        SimulatedScheduler scheduler(0);
        auto queue = scheduler.createQueue("test.self");
        queue->sync([&] { queue->sync([] {}); });
    };
    EXPECT_DEATH(self(), "test.self");
}

} // namespace
} // namespace tarn
