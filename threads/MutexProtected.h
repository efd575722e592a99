#pragma once

#include <mutex>
#include <utility>

namespace tarn {

/// A value that cannot be reached without its lock.
///
/// `use` must not call out to code that may come back here. What it takes out of the value is returned, so
/// that it is destroyed after the lock has been let go.
template <class T>
class MutexProtected {
public:
    MutexProtected() = default;
    explicit MutexProtected(T value) : value_(std::move(value)) {}

    template <class Use>
    auto withLocked(Use&& use) {
        std::lock_guard lock(mutex_);
        return std::forward<Use>(use)(value_);
    }

    template <class Use>
    auto withLocked(Use&& use) const {
        std::lock_guard lock(mutex_);
        return std::forward<Use>(use)(value_);
    }

private:
    mutable std::mutex mutex_;
    T value_{};
};

} // namespace tarn
