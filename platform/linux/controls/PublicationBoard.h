#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <mutex>
#include <optional>
#include <string>

#include "platform/NowPlayingService.h"

namespace tarn {

/// Where publications wait for the bus thread: a newer one takes the place of an older one, and the bus
/// thread is woken once for all of them. Any thread may call.
class PublicationBoard final {
public:
    struct Snapshot {
        NowPlayingInfo info;
        std::chrono::steady_clock::time_point time; // of the publication
        std::optional<std::string> application;
        std::uint64_t number = 0; // 0 before the first publication; else it grows with each
    };

    /// `wake` is to lead to a call of take(); it runs on the threads that publish, with no call of it
    /// running.
    explicit PublicationBoard(std::function<void()> wake) : wake_(std::move(wake)) {}

    /// Counts for the next publication, so that both are seen together; none counts at once.
    void setApplication(std::optional<std::string> application);
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
    std::optional<std::string> application_; // for the next publication
    Snapshot current_;
    bool woken_ = false;
};

} // namespace tarn
