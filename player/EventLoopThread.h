#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "player/DescriptorWatches.h"
#include "player/EventLoop.h"
#include "player/SystemPoller.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// The player thread of this machine. It also talks to the sound server: what the server asks for is rendered
/// where it is asked for, with no hand-off between threads and no lock. Without work, a timer that is due or
/// word from the server it sleeps: in poll(2) first, and in the library of the sound server once that is
/// loaded.
class EventLoopThread final : public EventLoop {
public:
    EventLoopThread();

    ~EventLoopThread() override;

    /// Ends the thread and waits for it. Work that has not begun is dropped, with all that it owns; so what
    /// belongs to the thread can be destroyed in peace. Not on the player thread; nothing may be posted
    /// after.
    void stop();

    void post(std::function<void()> work) override;
    [[nodiscard]] RegistrationHandle at(std::chrono::nanoseconds time, std::function<void()> work) override;
    bool isCurrent() const override;
    std::chrono::nanoseconds now() const override;

    /// Has `readable` called while there is something to be read from `descriptor`, or its other end is gone.
    /// The registration goes before the descriptor and the loop do. Player thread.
    [[nodiscard]] RegistrationHandle watch(int descriptor, std::function<void()> readable) {
        return watches_.add(descriptor, std::move(readable));
    }

    /// From its next turn on the thread sleeps with `poller`, which lives until stop(). Player thread.
    void sleepIn(Poller& poller);

private:
    class Timers;
    void run();
    void runPosted();
    void wake();

    const FileDescriptor wakeUp_;
    const std::shared_ptr<Timers> timers_;
    DescriptorWatches watches_; // player thread
    SystemPoller firstPoller_;
    Poller* poller_ = nullptr; // player thread

    std::mutex mutex_;
    std::vector<std::function<void()>> posted_; // under the mutex
    bool ending_ = false;                       // under the mutex

    std::thread thread_;
};

} // namespace tarn
