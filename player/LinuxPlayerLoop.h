#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "player/PlayerLoop.h"
#include "player/PollWait.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// The player thread of this machine. It also talks to the sound server: what the server asks for is rendered
/// where it is asked for, with no hand-off between threads and no lock. Without work, a timer that is due or
/// word from the server it sleeps: in poll(2) first, and in the library of the sound server once that is
/// loaded.
class LinuxPlayerLoop final : public PlayerLoop {
public:
    LinuxPlayerLoop();

    ~LinuxPlayerLoop() override;

    /// Ends the thread and waits for it. Work that has not begun is dropped, with all that it owns; so what
    /// belongs to the thread can be destroyed in peace. Not on the player thread; nothing may be posted
    /// after.
    void stop();

    void post(std::function<void()> work) override;
    [[nodiscard]] RegistrationHandle at(std::chrono::nanoseconds time, std::function<void()> work) override;
    bool isCurrent() const override;
    std::chrono::nanoseconds now() const override;

    /// From its next turn on the thread sleeps in `wait`, which lives until stop(). Player thread.
    void sleepIn(EventWait& wait);

private:
    class Timers;
    void run();
    void runPosted();
    void wake();

    const FileDescriptor wakeUp_;
    const std::shared_ptr<Timers> timers_;
    PollWait firstWait_;
    EventWait* wait_ = nullptr; // player thread

    std::mutex mutex_;
    std::vector<std::function<void()>> posted_; // under the mutex
    bool ending_ = false;                       // under the mutex

    std::thread thread_;
};

} // namespace tarn
