#pragma once

#include <string>
#include <vector>

#include <systemd/sd-bus.h>

#include "system/FileDescriptor.h"

namespace tarn {

/// The part of a login manager that deals with sleep, on a bus of the test's own. For one thread, and alive
/// only inside of its functions: the bus keeps what comes meanwhile.
class FakeLoginManager final {
public:
    explicit FakeLoginManager(const std::string& address);
    ~FakeLoginManager() { sd_bus_close_unref(bus_); }

    FakeLoginManager(const FakeLoginManager&) = delete;
    FakeLoginManager& operator=(const FakeLoginManager&) = delete;

    /// Waits until exactly these locks are held, as "what:mode" in alphabetical order.
    [[nodiscard]] bool waitForLocks(const std::vector<std::string>& locks);

    void prepareForSleep(bool beginning);

private:
    /// Held until the other end of its pipe is closed.
    struct Lock {
        std::string name;
        FileDescriptor end;
    };

    static int inhibit(sd_bus_message* message, void* manager, sd_bus_error*);
    std::vector<std::string> heldLocks();

    sd_bus* bus_ = nullptr;
    std::vector<Lock> locks_;
};

} // namespace tarn
