#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

#include "controls/BusLoop.h"
#include "controls/RemoteTargets.h"

namespace tarn {

/// The thread that delivers remote commands, one at a time and in order: a handler may wait for many seconds.
/// Any thread may call, except its own for the destructor.
class RemoteCommandThread final {
public:
    /// Runs on the bus thread.
    using Completion = std::function<void(RemoteCommandResult result)>;

    /// How many commands may wait; more are only ever sent to do harm.
    static constexpr std::size_t limit = 64;

    /// Both outlive the thread.
    RemoteCommandThread(BusLoop& loop, RemoteTargets& targets);

    /// Waits for the command that is being delivered and drops the others.
    ~RemoteCommandThread();

    RemoteCommandThread(const RemoteCommandThread&) = delete;
    RemoteCommandThread& operator=(const RemoteCommandThread&) = delete;

    /// Returns at once; false, and never a call of `completion`, when too many commands wait already.
    [[nodiscard]] bool deliver(RemoteCommandKind kind, Completion completion);

    /// The same for a command whose outcome nobody waits for: with too many waiting, it is let go.
    void deliverUnanswered(RemoteCommandKind kind);

    /// Is a command being delivered, or waiting to be?
    bool isBusy();

private:
    struct Delivery {
        RemoteCommandKind kind;
        Completion completion;
    };

    void run();

    BusLoop& loop_;
    RemoteTargets& targets_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<Delivery> waiting_;
    bool delivering_ = false;
    bool ending_ = false;
    std::thread thread_;
};

} // namespace tarn
