#pragma once

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <string>

#include "system/FileDescriptor.h"

namespace tarn::bench {

/// A tarnd on a socket of its own in an empty runtime folder. Ends with this object.
class ServiceProcess {
public:
    /// Returns when the service has said that it is ready.
    ServiceProcess();
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
    std::size_t threads() const;
    std::size_t openFiles() const;
    /// Times that its threads have waited and gone on, in all.
    long wakeups() const;

private:
    std::filesystem::path folder_;
    pid_t pid_ = -1;
    std::chrono::nanoseconds startTime_{};
};

} // namespace tarn::bench
