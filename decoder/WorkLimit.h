#pragma once

#include <chrono>
#include <ctime>

namespace tarn {

/// How much processor time one piece of work may take. Hostile files would have the library search or count
/// for hours; what waits for a slow disk is not meant. Measured for the calling thread.
class WorkLimit {
public:
    using Duration = std::chrono::nanoseconds;

    explicit WorkLimit(Duration most = {}) { start(most); }

    void start(Duration most) { end_ = used() + most; }
    bool over() const { return used() > end_; }

private:
    static Duration used() {
        timespec time{};
        clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
        return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
    }

    Duration end_{};
};

} // namespace tarn
