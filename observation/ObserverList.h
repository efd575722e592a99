#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "roles/Observable.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The observers of one observable object, which holds it as a member. Any thread may call, without a lock
/// that `read` or a block may want.
class ObserverList {
public:
    /// The value of a key path at the moment of the call; asserts that the object has the key path.
    using Read = ObservedValue (*)(const Observable& object, std::string_view keyPath);

    ObserverList(Observable& object, Read read) : object_(object), read_(read) {}
    ~ObserverList();
    ObserverList(const ObserverList&) = delete;
    ObserverList& operator=(const ObserverList&) = delete;

    /// What Observable::observe() promises.
    [[nodiscard]] RegistrationHandle observe(std::string_view keyPath, Observable::Block block);

    /// The value of `keyPath` has changed: every observer is called with the value that `read` then gives.
    /// The call of an observer that is busy on another thread, or further out on this one, is left to that
    /// one; several of these become one.
    void changed(std::string_view keyPath);

private:
    class Observer;
    class Membership;

    Observable& object_;
    const Read read_;
    MutexProtected<std::vector<std::shared_ptr<Observer>>> observers_;
};

} // namespace tarn
