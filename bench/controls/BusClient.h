#pragma once

#include <chrono>
#include <string>
#include <vector>

#include <systemd/sd-bus.h>

namespace tarn {

/// Calls that wait for their answer and take the time.
class BusClient final {
public:
    using Microseconds = std::chrono::duration<double, std::micro>;

    explicit BusClient(const std::string& address);
    ~BusClient();

    BusClient(const BusClient&) = delete;
    BusClient& operator=(const BusClient&) = delete;

    Microseconds pingPlayer();
    Microseconds readPosition();
    Microseconds readAllOfPlayer();

private:
    Microseconds call(const char* interface, const char* method, const std::vector<const char*>& arguments);

    sd_bus* bus_ = nullptr;
};

} // namespace tarn
