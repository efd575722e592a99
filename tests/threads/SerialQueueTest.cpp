#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <future>
#include <latch>
#include <random>
#include <thread>

#include "threads/BlockingSection.h"
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

TEST_F(SerialQueueTest, SyncOnAnIdleQueueRunsInPlace) {
    auto queue = queues_.create("test.idle");
    std::thread::id ranOn;
    queue->sync([&] {
        ranOn = std::this_thread::get_id();
        EXPECT_TRUE(queue->isCurrent());
    });
    EXPECT_EQ(ranOn, std::this_thread::get_id());
    EXPECT_FALSE(queue->isCurrent());
    EXPECT_EQ(queues_.pool().threads(), 0u);
}

TEST_F(SerialQueueTest, SyncWaitsForEverythingSubmittedBefore) {
    auto queue = queues_.create("test.busy");
    std::latch release(1);
    int ran = 0;
    queue->async([&] { release.wait(); });
    for (int i = 0; i < 100; ++i)
        queue->async([&] { ++ran; });
    std::jthread releaser([&] { release.count_down(); });
    queue->sync([&] { EXPECT_EQ(ran, 100); });
}

TEST_F(SerialQueueTest, WorkGivenToAnotherQueueIsTakenUpByTheSameWorker) {
    auto first = queues_.create("test.first");
    auto second = queues_.create("test.second");
    std::promise<bool> sameThread;
    first->async([&] {
        second->async([&, worker = std::this_thread::get_id()] {
            sameThread.set_value(worker == std::this_thread::get_id());
        });
    });
    EXPECT_TRUE(sameThread.get_future().get());
    EXPECT_EQ(queues_.pool().threads(), 1u);
}

TEST_F(SerialQueueTest, AWorkerThatBlocksLetsAnotherRunTheQueueItGaveWorkTo) {
    auto first = queues_.create("test.first");
    auto second = queues_.create("test.second");
    std::promise<bool> outcome;
    first->async([&] {
        auto signal = clock_.makeSignal();
        second->async([signal] { signal->signal(); });
        outcome.set_value(signal->wait(60s));
    });
    EXPECT_TRUE(outcome.get_future().get());
}

TEST_F(SerialQueueTest, BlockedWorkersDoNotHoldUpOtherQueues) {
    constexpr int blocked = static_cast<int>(WorkerPool::maxRunning) * 3;
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
}

TEST_F(SerialQueueTest, TheLastReferenceMayGoOnTheQueueItself) {
    auto warm = queues_.create("test.warm");
    for (int round = 0; round < 4'000; ++round) {
        auto queue = queues_.create("test.released");
        std::promise<void> gone;
        auto* raw = queue.get();
        raw->async([queue = std::move(queue), &gone, raw]() mutable {
            EXPECT_TRUE(raw->isCurrent());
            queue.reset();
            gone.set_value();
        });
        gone.get_future().wait();
    }
    EXPECT_LE(queues_.pool().threads(), WorkerPool::maxIdle + 1);
}

TEST_F(SerialQueueTest, WorkRunsAlthoughItsQueueWasLetGo) {
    std::latch ran(100);
    for (int i = 0; i < 100; ++i)
        queues_.create("test.dropped")->async([&] { ran.count_down(); });
    ran.wait();
}

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
