#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

#include "controls/BusLoop.h"
#include "roles/RemoteCommandCenter.h"

namespace tarn {

/// The thread that carries remote commands out, one at a time and in order: one of them may wait for many
/// seconds. Any thread may call, except its own for the destructor.
class RemoteCommandThread final {
public:
    using Command = std::function<RemoteCommandResult()>;

    /// Runs on the bus thread.
    using Completion = std::function<void(RemoteCommandResult result)>;

    /// How many commands may wait; more are only ever sent to do harm.
    static constexpr std::size_t limit = 64;

    /// The loop outlives the thread, and so does what the commands use.
    explicit RemoteCommandThread(BusLoop& loop);

    /// Waits for the command that is being carried out and drops the others.
    ~RemoteCommandThread();

    RemoteCommandThread(const RemoteCommandThread&) = delete;
    RemoteCommandThread& operator=(const RemoteCommandThread&) = delete;

    /// Returns at once; false, and never a call of either, when too many commands wait already. `completion`
    /// may be null.
    [[nodiscard]] bool deliver(Command command, Completion completion);

    /// Is a command being carried out, or waiting to be?
    bool isBusy();

private:
    struct Delivery {
        Command command;
        Completion completion;
    };

    void run();

    BusLoop& loop_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<Delivery> waiting_;
    bool delivering_ = false;
    bool ending_ = false;
    std::thread thread_;
};

} // namespace tarn
