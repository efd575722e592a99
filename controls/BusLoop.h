#pragma once

#include <functional>
#include <mutex>
#include <thread>
#include <vector>

#include "controls/BusHandles.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// The bus thread: the event loop that every connection of this folder lives on.
///
/// What is attached to event() is made before start() and goes after stop(), so that in between the bus
/// thread alone touches it.
class BusLoop final {
public:
    BusLoop();
    ~BusLoop();

    BusLoop(const BusLoop&) = delete;
    BusLoop& operator=(const BusLoop&) = delete;

    sd_event* event() const { return event_.get(); }

    void start();

    /// Joins the thread; work that was not begun is dropped. Never from the bus thread.
    void stop();

    /// From any thread: runs `work` on the bus thread, in order, at the latest when start() has been called.
    void post(std::function<void()> work);

private:
    void run();
    void drain();

    FileDescriptor wakeup_;
    EventHandle event_;
    EventSourceHandle wakeupSource_;
    std::mutex mutex_;
    std::vector<std::function<void()>> posted_;
    bool ending_ = false; // bus thread only
    std::thread thread_;
};

} // namespace tarn
