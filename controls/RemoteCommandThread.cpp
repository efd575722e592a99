#include "controls/RemoteCommandThread.h"

#include <utility>

#include <pthread.h>

namespace tarn {

RemoteCommandThread::RemoteCommandThread(BusLoop& loop) : loop_(loop), thread_([this] { run(); }) {}

RemoteCommandThread::~RemoteCommandThread() {
    {
        const std::lock_guard lock(mutex_);
        ending_ = true;
    }
    changed_.notify_one();
    thread_.join();
}

bool RemoteCommandThread::deliver(Command command, Completion completion) {
    {
        const std::lock_guard lock(mutex_);
        if (waiting_.size() >= limit)
            return false;
        waiting_.push_back({std::move(command), std::move(completion)});
    }
    changed_.notify_one();
    return true;
}

bool RemoteCommandThread::isBusy() {
    const std::lock_guard lock(mutex_);
    return delivering_ || !waiting_.empty();
}

void RemoteCommandThread::run() {
    pthread_setname_np(pthread_self(), "remote commands");
    std::unique_lock lock(mutex_);
    for (;;) {
        changed_.wait(lock, [this] { return ending_ || !waiting_.empty(); });
        if (ending_)
            return;
        Delivery delivery = std::move(waiting_.front());
        waiting_.pop_front();
        delivering_ = true;
        lock.unlock();
        const RemoteCommandResult result = std::exchange(delivery.command, nullptr)();
        if (delivery.completion)
            loop_.post([completion = std::move(delivery.completion), result] { completion(result); });
        lock.lock();
        delivering_ = false;
    }
}

} // namespace tarn
