#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <list>
#include <memory>
#include <mutex>
#include <thread>

namespace tarn {

/// Threads that are lent to serial queues while these have work.
///
/// A thread is made when work finds none free, and ends when enough others are idle. A worker that gives work
/// to a queue takes that queue up itself when it is done with its own, rather than wake another thread. Only
/// a few workers run at a time; those in a BlockingSection do not count.
class WorkerPool {
public:
    using TimePoint = std::chrono::steady_clock::time_point;

    static constexpr std::size_t maxRunning = 4;
    static constexpr std::size_t maxIdle = 3;
    /// With so many threads blocked at once, further work waits for one of them.
    static constexpr std::size_t maxThreads = 48;
    /// How long a worker stays with one task, and answers with the worker, while others wait.
    static constexpr std::chrono::milliseconds slice{1};

    class Task {
    public:
        virtual ~Task() = default;

        /// Works until nothing is left or `end` has passed; true when something is left.
        virtual bool run(TimePoint end) noexcept = 0;
    };

    WorkerPool() = default;

    /// Lets all scheduled tasks run out, then ends the threads. Not on a worker.
    ~WorkerPool();
    WorkerPool(const WorkerPool&) = delete;
    WorkerPool& operator=(const WorkerPool&) = delete;

    /// Any thread: runs `task` soon. A task must not be scheduled again before it has said that nothing is
    /// left.
    void schedule(std::shared_ptr<Task> task);

    /// Living threads, for tests.
    std::size_t threads() const;

private:
    friend class BlockingSection;
    using Threads = std::list<std::thread>;

    struct Worker {
        WorkerPool& pool;
        std::shared_ptr<Task> next; // to be taken up by this worker when it is done with its own
        bool blocked;               // in a BlockingSection
    };

    void makeReady(std::shared_ptr<Task> task);
    void wakeOrSpawnLocked();
    void beginBlocking(Worker& worker);
    void endBlocking(Worker& worker);
    void work(Threads::iterator self);
    void runSlices(Worker& worker, std::shared_ptr<Task> task);
    std::shared_ptr<Task> takeNext(Worker& worker);
    std::shared_ptr<Task> waitForTask(Threads::iterator self);
    void retireLocked(Threads::iterator self);
    void joinFinished();

    static thread_local Worker* currentWorker_;

    mutable std::mutex mutex_;
    std::condition_variable wake_;
    std::condition_variable retired_;
    std::deque<std::shared_ptr<Task>> ready_;
    Threads threads_;
    Threads finished_; // left work() or are about to; to be joined
    std::size_t idle_ = 0;
    std::size_t blocked_ = 0;
    bool stopping_ = false;
};

} // namespace tarn
