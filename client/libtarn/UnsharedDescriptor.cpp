#include "client/libtarn/UnsharedDescriptor.h"

#include <pthread.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <mutex>
#include <utility>
#include <vector>

namespace tarn {

namespace {

struct Registry {
    std::mutex mutex;
    std::vector<int> descriptors;
    std::atomic<unsigned> forks = 0;

    Registry() { ::pthread_atfork(&lock, &unlock, &leave); }

    static void lock();
    static void unlock();
    static void leave();
};

/// Never destroyed: a fork may come until the very end of the process.
Registry& registry() {
    static Registry& only = *new Registry;
    return only;
}

void Registry::lock() { registry().mutex.lock(); }

void Registry::unlock() { registry().mutex.unlock(); }

/// In the child, which has this thread only.
void Registry::leave() {
    for (const int number : registry().descriptors)
        ::close(number);
    registry().descriptors.clear();
    ++registry().forks;
    unlock();
}

} // namespace

UnsharedDescriptor::UnsharedDescriptor(const std::function<int()>& open) {
    const std::lock_guard lock(registry().mutex);
    registry().descriptors.reserve(registry().descriptors.size() + 1);
    number_ = open();
    if (number_ >= 0)
        registry().descriptors.push_back(number_);
}

UnsharedDescriptor::UnsharedDescriptor(UnsharedDescriptor&& other) noexcept
    : number_(std::exchange(other.number_, -1)) {}

UnsharedDescriptor& UnsharedDescriptor::operator=(UnsharedDescriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
}

void UnsharedDescriptor::reset() {
    if (number_ < 0)
        return;
    const std::lock_guard lock(registry().mutex);
    std::erase(registry().descriptors, number_);
    ::close(std::exchange(number_, -1));
}

ForkMark::ForkMark() : forks_(registry().forks) {}

bool ForkMark::isLeftBehind() const { return registry().forks != forks_; }

} // namespace tarn
