#include "platform/core/ObserverList.h"

#include <mutex>
#include <string>
#include <utility>

namespace tarn {

/// One registration. Changes are counted; the thread that finds the observer free makes the calls, also for
/// the changes that other threads count meanwhile.
class ObserverList::Observer {
public:
    Observer(std::string keyPath, std::shared_ptr<const Read> read, Observable::Block block)
        : keyPath_(std::move(keyPath)), read_(std::move(read)), block_(std::move(block)) {}

    const std::string& keyPath() const { return keyPath_; }

    /// Before anyone else knows the observer: the calls are the caller's, beginning with the initial one.
    void reserveInitialCall() {
        pending_ = 1;
        calling_ = true;
    }

    void makeReservedCalls(Observable& object) {
        while (takePending())
            block_(object, {{"new", (*read_)(keyPath_)}});
    }

    void changed(Observable& object) {
        {
            std::lock_guard lock(mutex_);
            ++pending_;
            if (std::exchange(calling_, true))
                return;
        }
        makeReservedCalls(object);
    }

    void end() {
        std::lock_guard lock(mutex_);
        ended_ = true;
    }

private:
    bool takePending() {
        std::lock_guard lock(mutex_);
        if (ended_ || pending_ == 0) {
            calling_ = false;
            return false;
        }
        --pending_;
        return true;
    }

    const std::string keyPath_;
    const std::shared_ptr<const Read> read_;
    const Observable::Block block_;
    std::mutex mutex_;
    std::size_t pending_ = 0;
    bool calling_ = false;
    bool ended_ = false;
};

class ObserverList::Membership final : public Registration {
public:
    Membership(const std::shared_ptr<Observers>& observers, std::shared_ptr<Observer> observer)
        : observers_(observers), observer_(std::move(observer)) {}

    ~Membership() override {
        observer_->end();
        if (auto observers = observers_.lock())
            observers->withLocked([this](auto& list) { std::erase(list, observer_); });
    }

private:
    const std::weak_ptr<Observers> observers_;
    const std::shared_ptr<Observer> observer_;
};

ObserverList::ObserverList(Observable& object, Read read)
    : object_(object),
      read_(std::make_shared<const Read>(std::move(read))),
      observers_(std::make_shared<Observers>()) {}

RegistrationHandle ObserverList::observe(std::string_view keyPath, Observable::Block block) {
    auto observer = std::make_shared<Observer>(std::string(keyPath), read_, std::move(block));
    observer->reserveInitialCall();
    auto membership = std::make_unique<Membership>(observers_, observer);
    observers_->withLocked([&](auto& list) { list.push_back(observer); });
    observer->makeReservedCalls(object_);
    return membership;
}

void ObserverList::changed(std::string_view keyPath) {
    auto observers = observers_->withLocked([&](const auto& list) {
        std::vector<std::shared_ptr<Observer>> matching;
        for (const auto& observer : list)
            if (observer->keyPath() == keyPath)
                matching.push_back(observer);
        return matching;
    });
    for (const auto& observer : observers)
        observer->changed(object_);
}

} // namespace tarn
