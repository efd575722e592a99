#include "observation/LocalNotificationCenter.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cassert>
#include <utility>
#include <vector>

namespace tarn {

class LocalNotificationCenter::Observer {
public:
    Observer(std::initializer_list<std::string_view> names, Handler handler) : handler_(std::move(handler)) {
        assert(names.size() <= names_.size());
        std::copy(names.begin(), names.end(), names_.begin());
    }

    bool hears(std::string_view name) const {
        return !name.empty() && std::find(names_.begin(), names_.end(), name) != names_.end();
    }

    void deliver(const Notification& notification) {
        if (!ended_)
            handler_(notification);
    }

    void end() { ended_ = true; }

private:
    std::array<std::string_view, mostNames> names_; // empty behind those that there are
    const Handler handler_;
    std::atomic<bool> ended_ = false;
};

class LocalNotificationCenter::Membership final : public Registration {
public:
    Membership(const std::shared_ptr<Observers>& observers, const void* sender,
               std::shared_ptr<Observer> observer)
        : observers_(observers), sender_(sender), observer_(std::move(observer)) {}

    ~Membership() override {
        observer_->end();
        if (auto observers = observers_.lock())
            observers->withLocked([this](auto& map) {
                const auto [first, last] = map.equal_range(sender_);
                map.erase(std::find_if(first, last,
                                       [this](const auto& entry) { return entry.second == observer_; }));
            });
    }

private:
    const std::weak_ptr<Observers> observers_;
    const void* const sender_;
    const std::shared_ptr<Observer> observer_;
};

LocalNotificationCenter::LocalNotificationCenter() : observers_(std::make_shared<Observers>()) {}

RegistrationHandle LocalNotificationCenter::addObserver(std::initializer_list<std::string_view> names,
                                                        const void* sender, Handler handler) {
    auto observer = std::make_shared<Observer>(names, std::move(handler));
    observers_->withLocked([&](auto& map) { map.emplace(sender, observer); });
    return std::make_unique<Membership>(observers_, sender, std::move(observer));
}

void LocalNotificationCenter::post(const Notification& notification) {
    const auto observers = observers_->withLocked([&](const auto& map) {
        std::vector<std::shared_ptr<Observer>> hearing;
        const auto [first, last] = map.equal_range(notification.sender);
        for (auto entry = first; entry != last; ++entry)
            if (entry->second->hears(notification.name))
                hearing.push_back(entry->second);
        return hearing;
    });
    for (const auto& observer : observers)
        observer->deliver(notification);
}

} // namespace tarn
