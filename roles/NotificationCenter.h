#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <map>
#include <string>
#include <string_view>
#include <utility>

#include "roles/Registration.h"

namespace tarn {

/// Something that happened to one object. `sender` only identifies it; handlers never dereference it.
struct Notification {
    std::string_view name;
    const void* sender = nullptr;
    std::map<std::string, std::uint64_t, std::less<>> info;
};

/// Passes notifications from whoever posts them to whoever listens. Any thread may call.
class NotificationCenter {
public:
    using Handler = std::function<void(const Notification&)>;

    virtual ~NotificationCenter() = default;

    static constexpr std::size_t mostNames = 3;

    /// `handler` runs on the posting thread, for notifications of these names, at most three, from that
    /// sender only. The names are literals, or outlive the registration otherwise.
    [[nodiscard]] virtual RegistrationHandle addObserver(std::initializer_list<std::string_view> names,
                                                         const void* sender, Handler handler) = 0;

    [[nodiscard]] RegistrationHandle addObserver(std::string_view name, const void* sender, Handler handler) {
        return addObserver({name}, sender, std::move(handler));
    }

    /// Calls the handlers that are registered now, in order of registration, with no lock held.
    virtual void post(const Notification& notification) = 0;
};

} // namespace tarn
