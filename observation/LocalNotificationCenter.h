#pragma once

#include <map>
#include <memory>

#include "roles/NotificationCenter.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Notifications within the process.
class LocalNotificationCenter final : public NotificationCenter {
public:
    LocalNotificationCenter();

    using NotificationCenter::addObserver;
    RegistrationHandle addObserver(std::initializer_list<std::string_view> names, const void* sender,
                                   Handler handler) override;
    void post(const Notification& notification) override;

private:
    class Observer;
    class Membership;
    /// By sender, in order of registration.
    using Observers = MutexProtected<std::multimap<const void*, std::shared_ptr<Observer>>>;

    const std::shared_ptr<Observers> observers_;
};

} // namespace tarn
