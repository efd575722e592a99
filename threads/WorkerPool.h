#pragma once

#include <cstddef>
#include <functional>
#include <memory>

#include "threads/Primitives.h"

namespace tarn {

/// The threads that run the work of all serial queues.
///
/// The problem: there are many serial queues, most of them idle, and a client may make more of them at any
/// time. A thread for each would cost memory, and waking a thread costs several times as much as what a
/// command does.
///
/// The idea: a queue that has work stands in one line, and the workers go to and from that line. A worker
/// takes the first queue, runs a turn of it, sends the answers that were made in that turn, and comes back.
/// With nothing in the line it goes to sleep; when enough others sleep already, it ends.
///
///     async() ──> [ queue | queue | queue ]  the line
///                   │               ▲
///             takes │               │ puts back what has more to do,
///                   ▼               │ and what it has given work to
///                 worker ── a turn ─┘
///
/// Two rules keep it going:
///
/// 1. While a queue stands in the line, a worker is on its way there. Whoever puts a queue into the line
///    wakes a sleeping worker or makes a new one. Only a worker that has come from the line need not: it
///    comes back anyhow. It may rely on this for one queue in each turn; for the next ones it calls somebody,
///    so that they run beside each other. A worker that is about to wait for something (BlockingSection)
///    sends somebody else.
/// 2. There is always a worker. The first one is made with the pool, and one ends only while others sleep.
///    So when the system has no more threads to give, all that was accepted still runs, only later: at the
///    latest when the workers that wait have what they wait for.
///
/// Nothing here allocates memory but the start of a thread, and that may fail: handing a queue over cannot.
class WorkerPool {
public:
    static constexpr std::size_t mostSleeping = 3;
    /// Four are at work for one client at most. The rest is for those that wait: with so many waiting at
    /// once, other work waits for one of them.
    static constexpr std::size_t mostWorkers = 48;

    /// What stands in the line: a serial queue.
    class Task {
    public:
        virtual ~Task() = default;

        /// Does a part of what there is to do, on a worker. Schedules itself again when more is left.
        virtual void runTurn() noexcept = 0;

    private:
        friend class WorkerPool;
        std::shared_ptr<Task> next_; // in the line
    };

    using StartThread = std::function<bool(std::function<void()> body)>;

    /// `start` says how a thread is made and whether it was. Throws std::system_error when there is no thread
    /// for the first worker.
    explicit WorkerPool(StartThread start = startThread);

    /// Lets everything in the line run out, then ends the workers. Not on a worker.
    ~WorkerPool();
    WorkerPool(const WorkerPool&) = delete;
    WorkerPool& operator=(const WorkerPool&) = delete;

    /// Any thread: puts `task` at the end of the line, in which it must not stand already.
    void schedule(std::shared_ptr<Task> task) noexcept;

    /// The living workers, for tests.
    std::size_t workers() const;

private:
    friend class BlockingSection;
    struct Worker;

    bool callWorker();
    void beginWaiting(Worker& worker);
    void work();
    std::shared_ptr<Task> takeFirst(Worker& worker);

    static thread_local Worker* current_;

    const StartThread start_;
    mutable Mutex mutex_; // guards what follows up to the semaphores
    std::shared_ptr<Task> first_;
    Task* last_ = nullptr; // good while there is a first one
    std::size_t workers_ = 0;
    std::size_t sleeping_ = 0; // those that nobody has woken yet
    bool stopping_ = false;
    Semaphore wake_{0};
    Semaphore lastEnded_{0};
};

} // namespace tarn
