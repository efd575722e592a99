#include "platform/core/LocalNotificationCenter.h"

#include <algorithm>
#include <atomic>
#include <utility>

namespace tarn {

class LocalNotificationCenter::Observer {
public:
    Observer(std::initializer_list<std::string_view> names, Handler handler)
        : names_(names), handler_(std::move(handler)) {}

    bool hears(std::string_view name) const {
        return std::find(names_.begin(), names_.end(), name) != names_.end();
    }

    void deliver(const Notification& notification) {
        if (!ended_)
            handler_(notification);
    }

    void end() { ended_ = true; }

private:
    const std::vector<std::string_view> names_;
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
            observers->withLocked([this](auto& map) { removeFrom(map); });
    }

private:
    template <class Map>
    void removeFrom(Map& map) {
        auto place = map.find(sender_);
        std::erase(place->second, observer_);
        if (place->second.empty())
            map.erase(place);
    }

    const std::weak_ptr<Observers> observers_;
    const void* const sender_;
    const std::shared_ptr<Observer> observer_;
};

LocalNotificationCenter::LocalNotificationCenter() : observers_(std::make_shared<Observers>()) {}

RegistrationHandle LocalNotificationCenter::addObserver(std::initializer_list<std::string_view> names,
                                                        const void* sender, Handler handler) {
    auto observer = std::make_shared<Observer>(names, std::move(handler));
    observers_->withLocked([&](auto& map) { map[sender].push_back(observer); });
    return std::make_unique<Membership>(observers_, sender, std::move(observer));
}

void LocalNotificationCenter::post(const Notification& notification) {
    auto observers = observers_->withLocked([&](const auto& map) {
        auto place = map.find(notification.sender);
        return place == map.end() ? std::vector<std::shared_ptr<Observer>>{} : place->second;
    });
    for (const auto& observer : observers)
        if (observer->hears(notification.name))
            observer->deliver(notification);
}

} // namespace tarn
