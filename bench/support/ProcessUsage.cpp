#include "bench/support/ProcessUsage.h"

#include <filesystem>
#include <fstream>
#include <string>

#include "bench/support/ProcFile.h"

namespace tarn {

ProcessUsage::ProcessUsage(pid_t process) {
    const std::filesystem::path folder = "/proc/" + std::to_string(process);
    for (const auto& task : std::filesystem::directory_iterator(folder / "task")) {
        long long nanoseconds = 0;
        std::ifstream(task.path() / "schedstat") >> nanoseconds;
        cpu += std::chrono::nanoseconds(nanoseconds);
        waits += numberInProcFile(task.path() / "status", "voluntary_ctxt_switches:");
        ++threads;
    }
    ownMemory = numberInProcFile(folder / "status", "RssAnon:");
    memory = numberInProcFile(folder / "smaps_rollup", "Pss:");
}

} // namespace tarn
