#pragma once

#include <sys/epoll.h>

#include <array>
#include <cstdint>
#include <span>

#include "system/FileDescriptor.h"

namespace tarn {

/// What the I/O thread waits on. wait() belongs to one thread; everything else may be called from any.
///
/// Every watched descriptor has a key by which its events are known. Events are EPOLLIN and the like,
/// reported again for as long as they last.
class SocketPoller {
public:
    /// The key of wake(); no watched descriptor has it.
    static constexpr std::uint64_t wakeKey = 0;

    /// Throws std::system_error.
    SocketPoller();

    /// False when the system cannot watch another one.
    [[nodiscard]] bool add(int descriptor, std::uint64_t key, std::uint32_t events);
    void change(int descriptor, std::uint64_t key, std::uint32_t events);
    void remove(int descriptor);

    /// Makes wait() return with wakeKey, now or the next time.
    void wake();

    /// Waits without limit; the events are good until the next call.
    std::span<const epoll_event> wait();

private:
    FileDescriptor epoll_;
    FileDescriptor wakeUp_;
    std::array<epoll_event, 16> events_{};
};

} // namespace tarn
