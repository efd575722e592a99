#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A message bus of the test's own, which starts no services, and what a desktop does with the media player
/// on it. It may die and come back under the same address.
class PrivateBus final {
public:
    enum class State { running, notYetStarted };

    explicit PrivateBus(State state = State::running);

    const std::string& address() const { return address_; }

    /// "DBUS_SESSION_BUS_ADDRESS=...", for programs that use it.
    std::string environment() const { return "DBUS_SESSION_BUS_ADDRESS=" + address_; }

    /// Returns when the bus accepts connections.
    void start();
    void kill() { daemon_.reset(); }
    void signal(int number) { daemon_->signal(number); }

    /// The command that calls a method of the player, such as {"Seek", "x", "5000000"}.
    std::vector<std::string> calling(std::vector<std::string> method) const;

    /// What the answer to that is: empty when it succeeded.
    std::string call(std::vector<std::string> method) const {
        return runCommand(calling(std::move(method))).output;
    }

    /// With its type, as in `s "Paused"`. `interface` is what stands behind org.mpris.MediaPlayer2.
    std::string property(const std::string& name, const std::string& interface = ".Player") const;

    /// Empty when it succeeded.
    std::string set(const std::string& name, const std::string& type, const std::string& value) const;

    CommandResult playerctl(std::vector<std::string> arguments) const;

private:
    std::string run(const std::string& verb, const std::string& interface,
                    std::vector<std::string> rest) const;

    TemporaryFolder folder_;
    std::string address_;
    std::unique_ptr<ChildProcess> daemon_;
};

} // namespace tarn
