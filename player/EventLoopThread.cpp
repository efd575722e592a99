#include "player/EventLoopThread.h"

#include <pthread.h>
#include <sys/eventfd.h>
#include <sys/timerfd.h>

#include <algorithm>
#include <cassert>
#include <cerrno>
#include <cstdint>
#include <system_error>
#include <utility>

namespace tarn {

namespace {

using std::chrono::nanoseconds;

nanoseconds steadyNow() { return std::chrono::steady_clock::now().time_since_epoch(); }

FileDescriptor checked(int descriptor, const char* what) {
    if (descriptor < 0)
        throw std::system_error(errno, std::generic_category(), what);
    return FileDescriptor(descriptor);
}

void takeCount(int descriptor) {
    std::uint64_t count = 0;
    [[maybe_unused]] const ssize_t size = ::read(descriptor, &count, sizeof count);
}

} // namespace

/// What is to run at some time; one timer of the kernel is set to the first of them. Outlived by nobody but
/// registrations.
class EventLoopThread::Timers : public std::enable_shared_from_this<Timers> {
public:
    Timers()
        : clock_(checked(timerfd_create(CLOCK_MONOTONIC, TFD_NONBLOCK | TFD_CLOEXEC), "timerfd_create")) {}

    int descriptor() const { return clock_.get(); }

    RegistrationHandle add(nanoseconds time, std::function<void()> work) {
        std::lock_guard lock(mutex_);
        const Key key{time, ++lastNumber_};
        waiting_.emplace(key, std::move(work));
        if (waiting_.begin()->first == key)
            set();
        return std::make_unique<Entry>(shared_from_this(), key);
    }

    /// Player thread: runs what is due, until something is not due yet.
    void runDue() {
        takeCount(clock_.get());
        for (;;) {
            std::function<void()> work;
            {
                std::lock_guard lock(mutex_);
                if (waiting_.empty() || waiting_.begin()->first.first > steadyNow())
                    return set();
                work = std::move(waiting_.begin()->second);
                waiting_.erase(waiting_.begin());
            }
            work();
        }
    }

    void clear() {
        std::map<Key, std::function<void()>> dropped; // destroyed behind the lock
        std::lock_guard lock(mutex_);
        dropped.swap(waiting_);
    }

private:
    using Key = std::pair<nanoseconds, std::uint64_t>;

    class Entry final : public Registration {
    public:
        Entry(std::shared_ptr<Timers> timers, Key key) : timers_(std::move(timers)), key_(key) {}
        ~Entry() override { timers_->remove(key_); }

    private:
        const std::shared_ptr<Timers> timers_;
        const Key key_;
    };

    // The kernel's timer is left as it is: at worst it wakes the thread once for nothing.
    void remove(const Key& key) {
        std::function<void()> work; // destroyed behind the lock
        std::lock_guard lock(mutex_);
        if (const auto found = waiting_.find(key); found != waiting_.end()) {
            work = std::move(found->second);
            waiting_.erase(found);
        }
        if (waiting_.empty())
            set();
    }

    void set() {
        itimerspec time{};
        if (!waiting_.empty()) {
            const auto when = std::max(waiting_.begin()->first.first, nanoseconds(1)).count();
            time.it_value = {static_cast<time_t>(when / 1'000'000'000),
                             static_cast<long>(when % 1'000'000'000)};
        }
        timerfd_settime(clock_.get(), TFD_TIMER_ABSTIME, &time, nullptr);
    }

    const FileDescriptor clock_;
    std::mutex mutex_;
    std::map<Key, std::function<void()>> waiting_;
    std::uint64_t lastNumber_ = 0;
};

EventLoopThread::EventLoopThread()
    : wakeUp_(checked(eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC), "eventfd")),
      timers_(std::make_shared<Timers>()) {
    sleepIn(firstPoller_);
    thread_ = std::thread([this] { run(); });
    pthread_setname_np(thread_.native_handle(), "player");
}

void EventLoopThread::sleepIn(Poller& poller) {
    poller.watch(wakeUp_.get(), [this] { takeCount(wakeUp_.get()); });
    poller.watch(timers_->descriptor(), [this] { timers_->runDue(); });
    poller.watch(watches_.descriptor(), [this] { watches_.callReady(); });
    poller_ = &poller;
}

EventLoopThread::~EventLoopThread() { stop(); }

void EventLoopThread::stop() {
    if (!thread_.joinable())
        return;
    assert(!isCurrent());
    {
        std::lock_guard lock(mutex_);
        ending_ = true;
    }
    wake();
    thread_.join();
    timers_->clear();
    for (std::vector<std::function<void()>> dropped; !posted_.empty(); dropped.clear())
        dropped.swap(posted_); // what is dropped may post its farewell
}

bool EventLoopThread::isCurrent() const { return std::this_thread::get_id() == thread_.get_id(); }

nanoseconds EventLoopThread::now() const { return steadyNow(); }

void EventLoopThread::wake() {
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t size = ::write(wakeUp_.get(), &one, sizeof one);
}

void EventLoopThread::post(std::function<void()> work) {
    bool first = false;
    {
        std::lock_guard lock(mutex_);
        first = posted_.empty();
        posted_.push_back(std::move(work));
    }
    if (first && !isCurrent())
        wake();
}

RegistrationHandle EventLoopThread::at(nanoseconds time, std::function<void()> work) {
    return timers_->add(time, std::move(work));
}

void EventLoopThread::run() {
    for (;;) {
        bool idle = false;
        {
            std::lock_guard lock(mutex_);
            if (ending_)
                return;
            idle = posted_.empty();
        }
        if (!poller_->wait(idle))
            return;
        runPosted();
    }
}

// What this work posts comes after the next look at timers and the server.
void EventLoopThread::runPosted() {
    std::vector<std::function<void()>> work;
    {
        std::lock_guard lock(mutex_);
        work.swap(posted_);
    }
    for (auto& piece : work)
        std::exchange(piece, nullptr)();
}

} // namespace tarn
