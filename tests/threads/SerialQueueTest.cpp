#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <functional>
#include <future>
#include <latch>
#include <optional>
#include <random>
#include <system_error>
#include <thread>
#include <vector>

#include "threads/BlockingSection.h"
#include "threads/Burst.h"
#include "threads/SteadyClock.h"
#include "threads/WorkerQueues.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

class SerialQueueTest : public testing::Test {
protected:
    WorkerQueues queues_;
    SteadyClock clock_;
};

TEST_F(SerialQueueTest, WorkOfManyThreadsRunsOneAtATimeAndInOrder) {
    auto queue = queues_.create("test.order");
    constexpr int threads = 4;
    constexpr int rounds = 20'000;
    std::array<int, threads> seen{}; // touched on the queue only
    std::array<bool, threads> inOrder;
    inOrder.fill(true);
    auto submit = [&](int id) {
        std::minstd_rand random(static_cast<unsigned>(id) + 1);
        for (int round = 0; round < rounds; ++round) {
            auto work = [&, id, round] {
                auto index = static_cast<std::size_t>(id);
                inOrder[index] = inOrder[index] && seen[index] == round && queue->isCurrent();
                ++seen[index];
            };
            if (random() % 8 == 0)
                queue->sync(work);
            else
                queue->async(work);
        }
    };
    {
        std::array<std::jthread, threads> submitters;
        for (int id = 0; id < threads; ++id)
            submitters[static_cast<std::size_t>(id)] = std::jthread(submit, id);
    }
    queue->sync([] {});
    EXPECT_THAT(seen, testing::Each(rounds));
    EXPECT_THAT(inOrder, testing::Each(true));
}

TEST_F(SerialQueueTest, BlockedWorkersDoNotHoldUpOtherQueues) {
    constexpr int blocked = static_cast<int>(WorkerPool::mostSleeping) * 4;
    auto release = clock_.makeSignal();
    std::latch done(blocked);
    for (int i = 0; i < blocked; ++i)
        queues_.create("test.blocked")->async([&, release] {
            EXPECT_TRUE(release->wait(60s));
            done.count_down();
        });
    std::promise<void> ran;
    queues_.create("test.free")->async([&] { ran.set_value(); });
    ran.get_future().wait();
    release->signal();
    done.wait();
    while (queues_.pool().workers() > WorkerPool::mostSleeping)
        std::this_thread::yield(); // until those that are too many have ended
}

TEST_F(SerialQueueTest, TheLastReferenceMayGoOnTheQueueItself) {
    for (int round = 0; round < 4'000; ++round) {
        auto queue = queues_.create("test.released");
        std::promise<bool> gone;
        auto* raw = queue.get();
        raw->async([queue = std::move(queue), last = std::shared_ptr<SerialQueue>(raw, [&](auto* itself) {
                                                  gone.set_value(itself->isCurrent());
                                              })] {});
        EXPECT_TRUE(gone.get_future().get());
    }
}

/// Queues for whose workers the system has so many threads, and no more until the limit is lifted.
class ScarceThreadsTest : public testing::TestWithParam<int> {
protected:
    std::atomic<int> left_ = GetParam();
    WorkerQueues queues_{[this](std::function<void()> body) {
        return left_.fetch_sub(1) > 0 && startThread(std::move(body));
    }};
    SteadyClock clock_;
};

/// Each piece of work goes from a first queue to one of two others, as a command does, and some of it waits.
TEST_P(ScarceThreadsTest, AllThatWasAcceptedRunsOnceAndInOrderAndAllIsWellWhenThereAreMore) {
    constexpr int count = 2'000;
    auto first = queues_.create("test.first");
    const std::array others{queues_.create("test.other"), queues_.create("test.another")};
    std::array<std::vector<int>, 2> ran; // each touched on its queue only
    std::latch done(count);
    const auto runOne = [&](int number, std::size_t side) {
        queues_.main().sync([] {});
        if (number % 100 == 0) {
            auto signal = clock_.makeSignal();
            std::jthread signaller([signal] { signal->signal(); });
            EXPECT_TRUE(signal->wait(60s));
        }
        ran[side].push_back(number);
        done.count_down();
    };
    for (int number = 0; number < count; ++number) {
        const auto handOver = [&, number] {
            queues_.main().async([] {});
            queues_.main().sync([] {}); // needs somebody to run what was submitted before
            const auto side = static_cast<std::size_t>(number % 2);
            others[side]->async([&, number, side] { runOne(number, side); });
        };
        if (number % 16 == 0)
            first->sync(handOver);
        else
            first->async(handOver);
    }
    done.wait();
    for (std::size_t side = 0; side < 2; ++side) {
        others[side]->sync([] {});
        EXPECT_EQ(ran[side].size(), count / 2u);
        EXPECT_TRUE(std::ranges::is_sorted(ran[side], std::ranges::less_equal()));
    }

    left_ = 1'000;
    std::latch bothRun(2);
    for (const auto& queue : others)
        queue->async([&] {
            BlockingSection blocking;
            bothRun.arrive_and_wait();
        });
    bothRun.wait();
}

INSTANTIATE_TEST_SUITE_P(Threads, ScarceThreadsTest, testing::Values(1, 2, 3));

class OneThreadTest : public ScarceThreadsTest {};

// The worker relies on itself to go on with the queue that it gave work to, but not while it waits.
TEST_P(OneThreadTest, AWorkerThatWaitsSendsAnotherWhetherTheWorkCameBeforeOrMeanwhile) {
    for (const bool meanwhile : {false, true}) {
        std::atomic<int> left = 1;
        WorkerQueues queues([&](auto body) { return left.fetch_sub(1) > 0 && startThread(std::move(body)); });
        auto second = queues.create("test.second");
        std::promise<bool> outcome;
        queues.create("test.first")->async([&] {
            left = 1;
            auto signal = clock_.makeSignal();
            std::optional<BlockingSection> blocking;
            if (meanwhile)
                blocking.emplace();
            second->async([signal] { signal->signal(); });
            outcome.set_value(signal->wait(20s));
        });
        EXPECT_TRUE(outcome.get_future().get());
    }
}

// Whoever waits may hold up the next queue of the worker, and the worker is the only one that can help.
TEST_P(OneThreadTest, AWorkerDoesNotLeaveAQueueThatSomebodyWaitsFor) {
    auto queue = queues_.create("test.queue");
    auto other = queues_.create("test.other");
    std::vector<std::string> order;
    std::latch workerIsInside(1); // else whoever waits would go in instead
    std::latch somebodyWaits(1);
    queue->async([&] {
        workerIsInside.count_down();
        somebodyWaits.wait();
    });
    workerIsInside.wait();
    for (int i = 0; i < 1'000; ++i)
        queue->async([] {});
    other->async([&] { order.push_back("other"); });
    std::jthread waiting([&] {
        struct Signal final : Burst::Deferred {
            explicit Signal(std::latch& counted) : latch(counted) {}
            void finishBurst() noexcept override { latch.count_down(); }
            std::latch& latch;
        };
        Burst burst;
        Burst::defer(std::make_shared<Signal>(somebodyWaits)); // let out when the thread begins to wait
        queue->sync([&] { order.push_back("waited for"); });
    });
    waiting.join();
    other->sync([] {});
    EXPECT_THAT(order, testing::ElementsAre("waited for", "other"));
}

INSTANTIATE_TEST_SUITE_P(, OneThreadTest, testing::Values(1));

using SerialQueueDeathTest = SerialQueueTest;

TEST_F(SerialQueueDeathTest, SyncFromTheQueueItselfAbortsWithTheLabel) {
    testing::GTEST_FLAG(death_test_style) = "threadsafe";
    auto outer = queues_.create("test.outer");
    auto inner = queues_.create("test.inner");
    auto outerAgain = [&] { outer->sync([] {}); };
    EXPECT_DEATH(outer->sync(outerAgain), "test.outer");
    EXPECT_DEATH(outer->sync([&] { inner->sync(outerAgain); }), "test.outer");
}

TEST_F(SerialQueueDeathTest, AnExceptionThatLeavesWorkEndsTheProcess) {
    testing::GTEST_FLAG(death_test_style) = "threadsafe";
    auto throwing = [&] { queues_.create("test.throw")->sync([] { throw std::runtime_error("escaped"); }); };
    EXPECT_DEATH(
        {
            try {
                throwing();
            } catch (const std::exception&) {
            }
        },
        "escaped");
}

TEST(WorkerQueuesTest, TheRunLoopOnlyWaitsForItsEndWhileTheMainQueueWorks) {
    WorkerQueues queues;
    std::promise<void> ran;
    std::jthread loop([&] { queues.runMainLoop(); });
    queues.main().async([&] { ran.set_value(); });
    ran.get_future().wait();
    queues.endMainLoop();
}

TEST(SteadyClockTest, ASignalEndsTheWaitAndTheLimitDoesToo) {
    SteadyClock clock;
    auto never = clock.makeSignal();
    auto before = clock.now();
    EXPECT_FALSE(never->wait(2ms));
    EXPECT_GE(clock.now() - before, 2ms);

    auto signal = clock.makeSignal();
    std::jthread signaller([signal] {
        signal->signal();
        signal->signal();
    });
    EXPECT_TRUE(signal->wait(60s));
    EXPECT_TRUE(signal->wait(0s));
}

} // namespace
} // namespace tarn
