#include "client/libtarn/LinkLoop.h"

#include <pthread.h>
#include <sys/eventfd.h>
#include <sys/timerfd.h>
#include <unistd.h>

#include <array>
#include <cassert>
#include <cerrno>
#include <csignal>
#include <system_error>
#include <utility>

namespace tarn {

namespace {

constexpr std::uint64_t timerKey = 1;
constexpr std::uint64_t wakeUpKey = 2;
constexpr std::uint64_t firstSocketKey = 3;

/// All of them: the program's own threads are to get them.
class SignalsBlocked {
public:
    SignalsBlocked() {
        sigset_t all;
        sigfillset(&all);
        ::pthread_sigmask(SIG_SETMASK, &all, &before_);
    }
    ~SignalsBlocked() { ::pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    SignalsBlocked(const SignalsBlocked&) = delete;
    SignalsBlocked& operator=(const SignalsBlocked&) = delete;

private:
    sigset_t before_{};
};

void change(int epoll, int operation, int descriptor, std::uint32_t events, std::uint64_t key) {
    epoll_event event{.events = events, .data = {.u64 = key}};
    if (::epoll_ctl(epoll, operation, descriptor, &event) != 0)
        throw std::system_error(errno, std::generic_category(), "epoll_ctl");
}

} // namespace

LinkLoop::LinkLoop(Handlers handlers)
    : handlers_(std::move(handlers)),
      epoll_([] { return ::epoll_create1(EPOLL_CLOEXEC); }),
      timer_([] { return ::timerfd_create(CLOCK_MONOTONIC, TFD_CLOEXEC | TFD_NONBLOCK); }),
      wakeUp_([] { return ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK); }),
      socketKey_(firstSocketKey) {
    if (!epoll_ || !timer_ || !wakeUp_)
        throw std::system_error(errno, std::generic_category(), "libtarn");
    change(epoll_.get(), EPOLL_CTL_ADD, timer_.get(), EPOLLIN, timerKey);
    change(epoll_.get(), EPOLL_CTL_ADD, wakeUp_.get(), EPOLLIN, wakeUpKey);
}

LinkLoop::~LinkLoop() { stop(); }

void LinkLoop::startThread() {
    const SignalsBlocked inTheThread;
    thread_ = std::thread([this] { run(); });
    ::pthread_setname_np(thread_.native_handle(), "libtarn");
}

void LinkLoop::stop() {
    assert(!isCurrent());
    stopping_ = true;
    ::eventfd_write(wakeUp_.get(), 1);
    if (thread_.joinable())
        thread_.join();
}

void LinkLoop::run() {
    runner_ = std::this_thread::get_id();
    std::array<epoll_event, 4> events{};
    while (!stopping_) {
        const int count = ::epoll_wait(epoll_.get(), events.data(), events.size(), -1);
        if (count > 0)
            dispatch(std::span(events).first(static_cast<std::size_t>(count)));
    }
}

void LinkLoop::drain() {
    std::array<epoll_event, 4> events{};
    const int count = ::epoll_wait(epoll_.get(), events.data(), events.size(), 0);
    if (count > 0)
        dispatch(std::span(events).first(static_cast<std::size_t>(count)));
}

void LinkLoop::dispatch(std::span<const epoll_event> events) {
    const auto held = hold();
    for (const auto& event : events) {
        std::uint64_t expirations = 0;
        if (event.data.u64 == socketKey_)
            handlers_.onSocket(event.events);
        else if (event.data.u64 == timerKey &&
                 ::read(timer_.get(), &expirations, sizeof(expirations)) == sizeof(expirations))
            handlers_.onTime(); // not if it was set anew meanwhile
    }
}

void LinkLoop::watch(int socket) { change(epoll_.get(), EPOLL_CTL_ADD, socket, EPOLLIN, ++socketKey_); }

void LinkLoop::unwatch(int socket) {
    ::epoll_ctl(epoll_.get(), EPOLL_CTL_DEL, socket, nullptr);
    ++socketKey_;
}

void LinkLoop::watchForRoom(int socket, bool wanted) {
    change(epoll_.get(), EPOLL_CTL_MOD, socket, wanted ? EPOLLIN | EPOLLOUT : EPOLLIN, socketKey_);
}

void LinkLoop::wakeAt(std::optional<Time> time) {
    itimerspec setting{};
    if (time) {
        const auto sinceStart = time->time_since_epoch();
        const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(sinceStart);
        setting.it_value.tv_sec = static_cast<time_t>(seconds.count());
        setting.it_value.tv_nsec = static_cast<long>(std::chrono::nanoseconds(sinceStart - seconds).count());
    }
    ::timerfd_settime(timer_.get(), TFD_TIMER_ABSTIME, &setting, nullptr);
}

} // namespace tarn
