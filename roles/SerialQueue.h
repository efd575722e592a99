#pragma once

#include <functional>
#include <memory>
#include <string>

#include "roles/Work.h"

namespace tarn {

/// Runs submitted work one piece at a time, in order of submission.
///
/// Every operation may be called from any thread, except sync() from the queue itself, which is a bug and
/// aborts with the label. Dropping the last reference, from any thread, lets the work that was submitted
/// before run to its end.
class SerialQueue {
public:
    virtual ~SerialQueue() = default;

    /// Returns at once; `work` keeps alive whatever it captured until it has run. `work` must not throw.
    virtual void async(Work work) = 0;

    /// Returns when `work`, and everything submitted before it, has run. `work` may run on the caller's
    /// thread.
    virtual void sync(const std::function<void()>& work) = 0;

    /// For assertions: is the caller running on this queue?
    virtual bool isCurrent() const = 0;

    virtual const std::string& label() const = 0;
};

/// Makes serial queues and owns the main one. Outlives every queue it made.
class SerialQueues {
public:
    virtual ~SerialQueues() = default;

    virtual std::shared_ptr<SerialQueue> create(std::string label) = 0;

    /// The queue that the main thread drains in runMainLoop().
    virtual SerialQueue& main() = 0;

    /// Drains the main queue on the calling (main) thread; returns only if the run loop is ended.
    virtual void runMainLoop() = 0;
};

} // namespace tarn
