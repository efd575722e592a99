#include <gtest/gtest.h>

#include <chrono>
#include <future>
#include <mutex>
#include <string>
#include <thread>

#include "threads/BlockingSection.h"
#include "threads/Burst.h"
#include "threads/WorkerQueues.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

class CountedFlush final : public Burst::Deferred {
public:
    void finishBurst() noexcept override {
        std::lock_guard lock(mutex_);
        ++count_;
        if (first_)
            first_->set_value();
        first_ = nullptr;
    }

    int count() const {
        std::lock_guard lock(mutex_);
        return count_;
    }

    void whenFirst(std::promise<void>& promise) { first_ = &promise; }

private:
    mutable std::mutex mutex_;
    int count_ = 0;
    std::promise<void>* first_ = nullptr;
};

TEST(BurstTest, WhatManyDeferIsDoneOnceAtTheEndOrBeforeABlock) {
    auto flush = std::make_shared<CountedFlush>();
    {
        Burst burst;
        Burst inner;
        Burst::defer(flush);
        Burst::defer(flush);
        EXPECT_EQ(flush->count(), 0);
        BlockingSection blocking;
        EXPECT_EQ(flush->count(), 1);
        Burst::defer(flush);
    }
    EXPECT_EQ(flush->count(), 2);
}

TEST(BurstTest, AllThatAWorkerFindsInAQueueBelongsToOneBurst) {
    WorkerQueues queues;
    auto queue = queues.create("test.queue");
    auto flush = std::make_shared<CountedFlush>();
    std::promise<void> flushed;
    flush->whenFirst(flushed);
    std::promise<void> submitted;
    queue->async([&] {
        submitted.get_future().wait();
        Burst::defer(flush);
    });
    for (int i = 0; i < 10; ++i)
        queue->async([&] {
            EXPECT_EQ(flush->count(), 0);
            Burst::defer(flush);
        });
    submitted.set_value();
    flushed.get_future().wait();
    queue->sync([&] { EXPECT_EQ(flush->count(), 1); });
}

TEST(BurstTest, AQueueThatIsNeverEmptyDoesNotHoldAnswersBack) {
    WorkerQueues queues;
    auto queue = queues.create("test.endless");
    auto flush = std::make_shared<CountedFlush>();
    std::promise<void> flushed;
    flush->whenFirst(flushed);
    std::atomic<bool> stop = false;
    std::function<void()> again = [&] {
        if (!stop)
            queue->async(again);
    };
    queue->async([&] {
        Burst::defer(flush);
        queue->async(again);
    });
    flushed.get_future().wait();
    stop = true;
    queue->sync([] {});
    queue->sync([] {});
}

} // namespace
} // namespace tarn
