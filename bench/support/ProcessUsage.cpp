#include "bench/support/ProcessUsage.h"

#include <filesystem>
#include <fstream>
#include <string>

namespace tarn {

namespace {

/// The number behind `key` in a file of lines "key: number ..."; 0 when it is not there.
long numberIn(const std::filesystem::path& file, const std::string& key) {
    std::ifstream stream(file);
    for (std::string word; stream >> word;)
        if (long number = 0; word == key && stream >> number)
            return number;
    return 0;
}

} // namespace

ProcessUsage::ProcessUsage(pid_t process) {
    const std::filesystem::path folder = "/proc/" + std::to_string(process);
    for (const auto& task : std::filesystem::directory_iterator(folder / "task")) {
        long long nanoseconds = 0;
        std::ifstream(task.path() / "schedstat") >> nanoseconds;
        cpu += std::chrono::nanoseconds(nanoseconds);
        waits += numberIn(task.path() / "status", "voluntary_ctxt_switches:");
        ++threads;
    }
    ownMemory = numberIn(folder / "status", "RssAnon:");
    memory = numberIn(folder / "smaps_rollup", "Pss:");
}

} // namespace tarn
