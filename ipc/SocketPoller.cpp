#include "ipc/SocketPoller.h"

#include <sys/eventfd.h>

#include <cassert>
#include <cerrno>
#include <system_error>

namespace tarn {

namespace {

epoll_event eventOf(std::uint64_t key, std::uint32_t events) {
    epoll_event event{};
    event.events = events;
    event.data.u64 = key;
    return event;
}

FileDescriptor checked(int descriptor, const char* what) {
    if (descriptor < 0)
        throw std::system_error(errno, std::generic_category(), what);
    return FileDescriptor(descriptor);
}

} // namespace

SocketPoller::SocketPoller()
    : epoll_(checked(epoll_create1(EPOLL_CLOEXEC), "epoll_create1")),
      wakeUp_(checked(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK), "eventfd")) {
    if (!add(wakeUp_.get(), wakeKey, EPOLLIN))
        throw std::system_error(errno, std::generic_category(), "epoll_ctl");
}

bool SocketPoller::add(int descriptor, std::uint64_t key, std::uint32_t events) {
    epoll_event event = eventOf(key, events);
    return epoll_ctl(epoll_.get(), EPOLL_CTL_ADD, descriptor, &event) == 0;
}

void SocketPoller::change(int descriptor, std::uint64_t key, std::uint32_t events) {
    epoll_event event = eventOf(key, events);
    [[maybe_unused]] const int result = epoll_ctl(epoll_.get(), EPOLL_CTL_MOD, descriptor, &event);
    assert(result == 0);
}

void SocketPoller::remove(int descriptor) {
    [[maybe_unused]] const int result = epoll_ctl(epoll_.get(), EPOLL_CTL_DEL, descriptor, nullptr);
    assert(result == 0);
}

void SocketPoller::wake() { eventfd_write(wakeUp_.get(), 1); }

std::span<const epoll_event> SocketPoller::wait() {
    int count = 0;
    do
        count = epoll_wait(epoll_.get(), events_.data(), static_cast<int>(events_.size()), -1);
    while (count < 0 && errno == EINTR);
    assert(count >= 0);
    for (int i = 0; i < count; ++i) {
        eventfd_t ignored = 0;
        if (events_[static_cast<std::size_t>(i)].data.u64 == wakeKey)
            eventfd_read(wakeUp_.get(), &ignored);
    }
    return std::span(events_).first(static_cast<std::size_t>(count));
}

} // namespace tarn
