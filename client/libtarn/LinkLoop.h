#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <mutex>
#include <optional>
#include <span>
#include <thread>

#include <sys/epoll.h>

#include "client/libtarn/UnsharedDescriptor.h"

namespace tarn {

/// Waits for one socket and one point in time, on a thread of its own or inside of the program's main loop.
///
/// The thread does nothing but what a program does by itself that polls descriptor() and calls drain(). The
/// two handlers are called with the loop held, one at a time.
class LinkLoop {
public:
    using Time = std::chrono::steady_clock::time_point;

    struct Handlers {
        std::function<void(std::uint32_t events)> onSocket; ///< events of epoll(7); must not throw
        std::function<void()> onTime;                       ///< must not throw
    };

    /// Throws std::system_error.
    explicit LinkLoop(Handlers handlers);
    LinkLoop(const LinkLoop&) = delete;
    LinkLoop& operator=(const LinkLoop&) = delete;

    /// stop().
    ~LinkLoop();

    /// From now on a thread waits, with all signals blocked. Throws std::system_error.
    void startThread();

    /// Ends the thread, if there is one, and waits for it. Not on that thread.
    void stop();

    /// Readable when drain() has something to do.
    int descriptor() const { return epoll_.get(); }

    /// Calls the handlers for what has happened, without waiting.
    void drain();

    /// While this is held no handler runs, apart from one that holds it itself.
    [[nodiscard]] std::unique_lock<std::recursive_mutex> hold() { return std::unique_lock(held_); }

    /// Is this called on the loop's own thread?
    bool isCurrent() const { return runner_ == std::this_thread::get_id(); }

    // The socket, one at a time. With the loop held.
    void watch(int socket);
    void unwatch(int socket);
    /// Any thread: whether the handler is also called when the socket takes more.
    void watchForRoom(int socket, bool wanted);

    /// Any thread: calls onTime at that time, once; nullopt takes it back. The last call counts.
    void wakeAt(std::optional<Time> time);

private:
    void run();
    void dispatch(std::span<const epoll_event> events);

    const Handlers handlers_;
    const UnsharedDescriptor epoll_;
    const UnsharedDescriptor timer_;
    const UnsharedDescriptor wakeUp_;
    std::recursive_mutex held_;
    std::atomic<std::uint64_t> socketKey_; // another one for each socket: an event may come late
    std::atomic<bool> stopping_ = false;
    std::atomic<std::thread::id> runner_;
    std::thread thread_;
};

} // namespace tarn
