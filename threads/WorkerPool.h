#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <list>
#include <memory>
#include <mutex>
#include <semaphore>
#include <thread>
#include <vector>

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

    struct Worker {
        explicit Worker(WorkerPool& owner) : pool(owner) {}

        WorkerPool& pool;
        std::shared_ptr<Task> next; // to be taken up by this worker when it is done with its own
        bool blocked = false;       // in a BlockingSection

        std::counting_semaphore<> wake{0};
        std::shared_ptr<Task> given; // to an idle worker, before it is woken
        std::thread thread;          // under the pool's lock
    };
    using Workers = std::list<std::shared_ptr<Worker>>;

    void makeReady(std::shared_ptr<Task> task);
    std::shared_ptr<Worker> giveLocked(std::shared_ptr<Task> task);
    void spawnLocked();
    void beginBlocking(Worker& worker);
    void endBlocking(Worker& worker);
    void work(Workers::iterator self);
    void runSlices(Worker& worker, std::shared_ptr<Task> task);
    std::shared_ptr<Task> takeNext(Worker& worker);
    std::shared_ptr<Task> takeReadyLocked();
    std::shared_ptr<Task> waitForTask(Workers::iterator self);
    void joinFinished();

    static thread_local Worker* currentWorker_;

    mutable std::mutex mutex_;
    std::condition_variable retired_;
    std::deque<std::shared_ptr<Task>> ready_; // empty while a worker is idle
    Workers workers_;
    Workers finished_;                          // left work() or are about to; to be joined
    std::vector<std::shared_ptr<Worker>> idle_; // the last one worked last: its memory is the warmest
    std::size_t blocked_ = 0;
    bool stopping_ = false;
};

} // namespace tarn
