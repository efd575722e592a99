#pragma once

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// The service itself, with a runtime folder and data folders of its own. Nothing of the system's is used.
class RunningService final {
public:
    /// Returns when the service is ready. `environment` says where the sound server and the buses
    /// are; without one for the system bus there is none.
    RunningService(std::vector<std::string> environment, const std::string& program);

    pid_t pid() const { return process_->pid(); }
    std::string socketPath() const { return folder_ / "ostrel.tarnd"; }
    const TemporaryFolder& folder() const { return folder_; }

    /// Reads the log up to a line that holds `text`; false when none came.
    [[nodiscard]] bool waitForLog(std::string_view text) { return process_->readUntil(text); }

private:
    TemporaryFolder folder_;
    std::unique_ptr<ChildProcess> process_;
};

} // namespace tarn
