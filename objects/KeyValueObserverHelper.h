#pragma once

#include <memory>
#include <string_view>

#include "roles/Observable.h"

namespace tarn {

/// Watches one property of one object with a block, from its making until it is stopped or destroyed.
///
/// The block runs once inside the making, so whatever it reads is set up before; then on whatever thread
/// changes the value, never two at a time. It may let go of the helper or of the object. Stopping does not
/// wait for a block that is running. One thread at a time uses the helper itself.
class VLTorviKeyValueObserverHelper final {
public:
    using ObserverBlock = Observable::Block;

    static std::unique_ptr<VLTorviKeyValueObserverHelper>
    startObservingObject(Observable& object, std::string_view keyPath, ObserverBlock observerBlock);

    VLTorviKeyValueObserverHelper(Observable& object, std::string_view keyPath, ObserverBlock observerBlock);

    /// Harmless when it has stopped before, and when the object is gone.
    void stopObservingObject();

private:
    RegistrationHandle observation_;
};

} // namespace tarn
