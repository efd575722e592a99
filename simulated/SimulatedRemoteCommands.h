#pragma once

#include <memory>
#include <vector>

#include "controls/RemoteTargets.h"
#include "simulated/SimulatedQueue.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

/// The media keys in the test's hand. The thread that delivers remote commands is one of the scheduler's.
class SimulatedRemoteCommands final {
public:
    explicit SimulatedRemoteCommands(SimulatedScheduler& scheduler)
        : thread_(scheduler.createQueue("remote commands")) {}

    /// The role.
    RemoteTargets& center() { return targets_; }

    /// Returns at once; the command is delivered on its thread.
    void press(RemoteCommandKind kind) {
        thread_->async([this, kind] { results_.push_back(targets_.deliver(kind)); });
    }

    /// What the commands delivered so far came to.
    const std::vector<RemoteCommandResult>& results() const { return results_; }

private:
    RemoteTargets targets_;
    const std::shared_ptr<SimulatedQueue> thread_;
    std::vector<RemoteCommandResult> results_;
};

} // namespace tarn
