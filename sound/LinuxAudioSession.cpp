#include "sound/LinuxAudioSession.h"

#include <pthread.h>

namespace tarn {

LinuxAudioSession::LinuxAudioSession(NotificationCenter& notifications)
    : notifications_(notifications), thread_([this] { run(); }) {
    pthread_setname_np(thread_.native_handle(), "session");
}

LinuxAudioSession::~LinuxAudioSession() {
    {
        std::lock_guard lock(mutex_);
        ending_ = true;
    }
    changed_.notify_one();
    thread_.join();
}

// One category, and streams are always described as music: nothing here can be refused.
std::optional<Error> LinuxAudioSession::setCategory(Category, Mode, RouteSharingPolicy, std::uint64_t) {
    return std::nullopt;
}

void LinuxAudioSession::activateWithOptions(std::uint64_t, ActivationCompletion completion) {
    perform([completion = std::move(completion)] { completion(true, std::nullopt); });
}

void LinuxAudioSession::streamInterrupted(const void* stream) {
    interrupted_.insert(stream);
    notify(interruptionBegan, std::nullopt); // also for one that begins to play during an interruption
}

void LinuxAudioSession::streamReleased(const void* stream) {
    if (interrupted_.erase(stream) > 0 && interrupted_.empty())
        notify(interruptionEnded, optionShouldResume);
}

void LinuxAudioSession::streamGone(const void* stream) {
    if (interrupted_.erase(stream) > 0 && interrupted_.empty())
        notify(interruptionEnded, std::nullopt);
}

void LinuxAudioSession::notify(std::uint64_t type, std::optional<std::uint64_t> options) {
    perform([this, type, options] {
        Notification notification{interruptionNotification, static_cast<AudioSession*>(this), {}};
        notification.info[interruptionTypeKey] = type;
        if (options)
            notification.info[interruptionOptionsKey] = *options;
        notifications_.post(notification);
    });
}

void LinuxAudioSession::perform(std::function<void()> work) {
    {
        std::lock_guard lock(mutex_);
        work_.push_back(std::move(work));
    }
    changed_.notify_one();
}

void LinuxAudioSession::run() {
    std::unique_lock lock(mutex_);
    for (;;) {
        changed_.wait(lock, [this] { return ending_ || !work_.empty(); });
        if (work_.empty())
            return;
        std::function<void()> work = std::move(work_.front());
        work_.pop_front();
        lock.unlock();
        work();
        work = nullptr;
        lock.lock();
    }
}

} // namespace tarn
