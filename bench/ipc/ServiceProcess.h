#pragma once

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <string>

#include "system/FileDescriptor.h"

namespace tarn::bench {

/// A tarnd with a socket of its own in an empty runtime folder. It ends with this object.
class ServiceProcess {
public:
    /// Starts `program`, by default the service of this build, and returns when it has said that it is ready.
    explicit ServiceProcess(const std::filesystem::path& program = TARND);
    ~ServiceProcess();
    ServiceProcess(const ServiceProcess&) = delete;
    ServiceProcess& operator=(const ServiceProcess&) = delete;

    std::chrono::nanoseconds startTime() const { return startTime_; }
    const std::filesystem::path& folder() const { return folder_; }
    pid_t pid() const { return pid_; }

    FileDescriptor connect() const;

    /// Proportional set size in KiB.
    long memory() const;
    /// Resident memory in KiB.
    long residentMemory() const;
    /// Resident memory in KiB that belongs to no file.
    long anonymousMemory() const;
    /// What it has used of a processor, also in threads that have ended.
    std::chrono::nanoseconds processorTime() const;
    std::size_t threads() const;
    std::size_t openFiles() const;
    /// How often its living threads have waited and gone on, in all.
    long wakeups() const;

private:
    std::filesystem::path folder_;
    pid_t pid_ = -1;
    std::chrono::nanoseconds startTime_{};
};

} // namespace tarn::bench
