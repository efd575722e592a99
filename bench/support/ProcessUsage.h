#pragma once

#include <chrono>

#include <sys/types.h>

namespace tarn {

/// What a process has used so far, by its own account in /proc. Threads that have ended are left out.
struct ProcessUsage {
    explicit ProcessUsage(pid_t process);

    std::chrono::nanoseconds cpu{0};
    long waits = 0;     // voluntary context switches
    long threads = 0;   // now
    long ownMemory = 0; // now, KiB that belong to no file
    long memory = 0;    // now, KiB, with its share of what it has in common with other processes
};

} // namespace tarn
