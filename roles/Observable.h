#pragma once

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <variant>

#include "roles/Registration.h"

namespace tarn {

class MediaItem;

/// What an observation reports beside the object: the value as it was when the report was made, under "new".
using ObservedValue = std::variant<std::int64_t, float, std::shared_ptr<MediaItem>>;
using ChangeDescription = std::map<std::string, ObservedValue, std::less<>>;

/// An object whose named properties can be watched.
class Observable {
public:
    using Block = std::function<void(Observable& object, const ChangeDescription& change)>;

    virtual ~Observable() = default;

    /// Watches `keyPath`: `block` runs once inside this call with the value of the moment, then after every
    /// change, on the thread that made the change or on one that is already reporting for this registration.
    ///
    /// Calls of one registration never overlap; changes that are made during a call share the one that
    /// follows it. The last call sees the last value. No lock of the object is held meanwhile. A key path
    /// that the object does not have is a bug; its name outlives the registration, as a literal does.
    [[nodiscard]] virtual RegistrationHandle observe(std::string_view keyPath, Block block) = 0;
};

} // namespace tarn
