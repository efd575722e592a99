#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "platform/Observable.h"
#include "platform/core/MutexProtected.h"

namespace tarn {

/// The observers of one observable object, which holds it as a member. Any thread may call, without a lock
/// that `read` or a block may want.
class ObserverList {
public:
    /// The value of a key path at the moment of the call; asserts that the object has the key path.
    using Read = std::function<ObservedValue(std::string_view keyPath)>;

    ObserverList(Observable& object, Read read);

    /// What Observable::observe() promises.
    [[nodiscard]] RegistrationHandle observe(std::string_view keyPath, Observable::Block block);

    /// The value of `keyPath` has changed: every observer is called once with the value that `read` then
    /// gives. The call of an observer that is busy on another thread, or further out on this one, is left to
    /// that one.
    void changed(std::string_view keyPath);

private:
    class Observer;
    class Membership;
    using Observers = MutexProtected<std::vector<std::shared_ptr<Observer>>>;

    Observable& object_;
    const std::shared_ptr<const Read> read_;
    const std::shared_ptr<Observers> observers_;
};

} // namespace tarn
