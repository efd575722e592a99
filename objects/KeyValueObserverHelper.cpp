#include "objects/KeyValueObserverHelper.h"

#include <utility>

namespace tarn {

std::unique_ptr<VLTorviKeyValueObserverHelper>
VLTorviKeyValueObserverHelper::startObservingObject(Observable& object, std::string_view keyPath,
                                                    ObserverBlock observerBlock) {
    return std::make_unique<VLTorviKeyValueObserverHelper>(object, keyPath, std::move(observerBlock));
}

VLTorviKeyValueObserverHelper::VLTorviKeyValueObserverHelper(Observable& object, std::string_view keyPath,
                                                             ObserverBlock observerBlock)
    : observation_(object.observe(keyPath, std::move(observerBlock))) {}

void VLTorviKeyValueObserverHelper::stopObservingObject() {
    // Moved out first: the block's captures die with the observation and may come back here.
    RegistrationHandle ended = std::move(observation_);
}

} // namespace tarn
