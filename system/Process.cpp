#include "system/Process.h"

#include <malloc.h>
#include <sys/resource.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <thread>
#include <utility>

namespace tarn {

namespace {

sigset_t stopSignals() {
    sigset_t set;
    sigemptyset(&set);
    for (const int number : {SIGTERM, SIGINT, SIGHUP})
        sigaddset(&set, number);
    return set;
}

} // namespace

void prepareSignals() {
    std::signal(SIGPIPE, SIG_IGN);
    const sigset_t set = stopSignals();
    pthread_sigmask(SIG_BLOCK, &set, nullptr);
}

void endOnStopSignals(std::function<void()> beforeEnd) {
    std::thread([beforeEnd = std::move(beforeEnd)] {
        const sigset_t set = stopSignals();
        int number = 0;
        while (sigwait(&set, &number) != 0) {
        }
        beforeEnd();
        _exit(EXIT_SUCCESS);
    }).detach();
}

void raiseFileLimit() {
    rlimit limit{};
    if (::getrlimit(RLIMIT_NOFILE, &limit) != 0)
        return;
    limit.rlim_cur = limit.rlim_max;
    ::setrlimit(RLIMIT_NOFILE, &limit);
}

void returnFreedMemory() {
    constexpr int mostKept = 1024 * 1024; // a frame of usual length costs no system call
    ::mallopt(M_MMAP_THRESHOLD, mostKept);
    ::mallopt(M_TRIM_THRESHOLD, mostKept);
}

} // namespace tarn
