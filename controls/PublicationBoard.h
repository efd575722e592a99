#pragma once

#include <functional>
#include <mutex>

#include "controls/MprisState.h"
#include "roles/NowPlayingService.h"

namespace tarn {

/// Where what was published waits to be shown, and what wakes the bus thread for that: once for all that has
/// come since it looked. Any thread may call.
class PublicationBoard final {
public:
    struct Publication {
        NowPlayingInfo info;
        ApplicationLabel application;
    };

    /// `wake` is to lead to a call of take(); it runs on the threads that call, with no call of it running.
    PublicationBoard(ApplicationLabel application, std::function<void()> wake);

    /// Both are seen from the next show() on.
    void setApplication(ApplicationLabel application);
    void setInfo(const NowPlayingInfo& info);

    /// What was set is what take() gives from now on.
    void show();

    /// Something that the bus thread shows has changed.
    void touch();

    /// Wakes nobody any more, once it has returned.
    void close();

    /// What is to be shown; later changes wake the bus thread again.
    Publication take();

private:
    std::mutex mutex_;
    std::function<void()> wake_;
    Publication set_;
    Publication shown_;
    bool woken_ = false;
};

} // namespace tarn
