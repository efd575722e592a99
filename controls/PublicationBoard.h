#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <mutex>

#include "controls/MprisState.h"
#include "roles/NowPlayingService.h"

namespace tarn {

/// Where publications wait for the bus thread: a newer one takes the place of an older one, and the bus
/// thread is woken once for all of them. Any thread may call.
class PublicationBoard final {
public:
    struct Snapshot {
        NowPlayingInfo info;
        std::chrono::steady_clock::time_point time; // of the publication
        ApplicationLabel application;
        std::uint64_t number = 0; // 0 before the first publication; else it grows with each
    };

    /// `wake` is to lead to a call of take(); it runs on the threads that publish, with no call of it
    /// running.
    PublicationBoard(ApplicationLabel application, std::function<void()> wake);

    /// Holds for the publications that follow, and is seen together with the next one.
    void setApplication(ApplicationLabel application);

    /// Holds at once, also for what was published before.
    void replaceApplication(ApplicationLabel application);

    void publish(const NowPlayingInfo& info);

    /// Something else has changed that the bus thread must look at.
    void touch();

    /// Wakes nobody any more, once it has returned.
    void close();

    /// What stands there now; later changes wake the bus thread again.
    Snapshot take();

private:
    void wake();

    std::mutex mutex_;
    std::function<void()> wake_;
    ApplicationLabel application_; // for the next publication
    Snapshot current_;
    bool woken_ = false;
};

} // namespace tarn
