#pragma once

#include <systemd/sd-bus.h>

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tarn::tool {

template <auto release>
struct Release {
    void operator()(auto* handle) const { release(handle); }
};
using BusHandle = std::unique_ptr<sd_bus, Release<sd_bus_flush_close_unref>>;
using MessageHandle = std::unique_ptr<sd_bus_message, Release<sd_bus_message_unref>>;

/// Throws Problem when a function of the bus library has failed.
void requireBus(int result);

/// A connection to the user's session bus, for calls that wait for their answers. For one thread.
class Bus {
public:
    /// Throws Problem when there is no bus.
    Bus();

    sd_bus* get() const { return bus_.get(); }

    /// The names on the bus that are `prefix`, or continue it with a dot.
    std::vector<std::string> namesBelow(const std::string& prefix) const;

    /// To the media player that has the name. Nothing is started for it.
    MessageHandle newCall(const std::string& name, const char* interface, const char* member) const;

    /// The answer; none when nobody is there. Throws Problem when it does not come within the limit or is an
    /// error.
    std::optional<MessageHandle> answer(const MessageHandle& call, std::chrono::microseconds limit) const;

private:
    BusHandle bus_;
};

} // namespace tarn::tool
