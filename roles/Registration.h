#pragma once

#include <memory>

namespace tarn {

/// Something that was registered: an observer, a notification handler, a command target. Destroying it ends
/// the registration.
///
/// May be destroyed on any thread, also from inside the registered block. Destruction does not wait for a
/// block that is running; a block that had not begun is not begun any more.
class Registration {
public:
    virtual ~Registration() = default;

protected:
    Registration() = default;
    Registration(const Registration&) = delete;
    Registration& operator=(const Registration&) = delete;
};

using RegistrationHandle = std::unique_ptr<Registration>;

} // namespace tarn
