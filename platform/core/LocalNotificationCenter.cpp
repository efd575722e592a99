#include "platform/core/LocalNotificationCenter.h"

#include <atomic>

namespace tarn {

class LocalNotificationCenter::Observer {
public:
    explicit Observer(Handler handler) : handler_(std::move(handler)) {}

    void deliver(const Notification& notification) {
        if (!ended_)
            handler_(notification);
    }

    void end() { ended_ = true; }

private:
    const Handler handler_;
    std::atomic<bool> ended_ = false;
};

class LocalNotificationCenter::Membership final : public Registration {
public:
    Membership(const std::shared_ptr<Observers>& observers, Key key, std::shared_ptr<Observer> observer)
        : observers_(observers), key_(std::move(key)), observer_(std::move(observer)) {}

    ~Membership() override {
        observer_->end();
        if (auto observers = observers_.lock())
            observers->withLocked([this](auto& map) { removeFrom(map); });
    }

private:
    template <class Map>
    void removeFrom(Map& map) {
        auto place = map.find(key_);
        std::erase(place->second, observer_);
        if (place->second.empty())
            map.erase(place);
    }

    const std::weak_ptr<Observers> observers_;
    const Key key_;
    const std::shared_ptr<Observer> observer_;
};

LocalNotificationCenter::LocalNotificationCenter() : observers_(std::make_shared<Observers>()) {}

RegistrationHandle LocalNotificationCenter::addObserver(std::string_view name, const void* sender,
                                                        Handler handler) {
    auto observer = std::make_shared<Observer>(std::move(handler));
    Key key{sender, std::string(name)};
    observers_->withLocked([&](auto& map) { map[key].push_back(observer); });
    return std::make_unique<Membership>(observers_, std::move(key), std::move(observer));
}

void LocalNotificationCenter::post(const Notification& notification) {
    auto observers = observers_->withLocked([&](const auto& map) {
        auto place = map.find(Key{notification.sender, std::string(notification.name)});
        return place == map.end() ? std::vector<std::shared_ptr<Observer>>{} : place->second;
    });
    for (const auto& observer : observers)
        observer->deliver(notification);
}

} // namespace tarn
