#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "platform/NotificationCenter.h"
#include "platform/core/MutexProtected.h"

namespace tarn {

/// Notifications within the process.
class LocalNotificationCenter final : public NotificationCenter {
public:
    LocalNotificationCenter();

    RegistrationHandle addObserver(std::string_view name, const void* sender, Handler handler) override;
    void post(const Notification& notification) override;

private:
    class Observer;
    class Membership;
    using Key = std::pair<const void*, std::string>; // sender and name
    using Observers = MutexProtected<std::map<Key, std::vector<std::shared_ptr<Observer>>>>;

    const std::shared_ptr<Observers> observers_;
};

} // namespace tarn
