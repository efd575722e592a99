#pragma once

#include <memory>
#include <string>

#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A message bus of the test's own, which starts no services. It may die and come back under the same
/// address.
class PrivateBus final {
public:
    enum class State { running, notYetStarted };

    explicit PrivateBus(State state = State::running);

    const std::string& address() const { return address_; }

    /// "DBUS_SESSION_BUS_ADDRESS=...", for programs that use it.
    std::string environment() const { return "DBUS_SESSION_BUS_ADDRESS=" + address_; }

    /// Returns when the bus accepts connections.
    void start();
    void kill();
    void signal(int number) { daemon_->signal(number); }

private:
    TemporaryFolder folder_;
    std::string address_;
    std::unique_ptr<ChildProcess> daemon_;
};

} // namespace tarn
