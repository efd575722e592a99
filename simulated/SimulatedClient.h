#pragma once

#include <functional>
#include <string>

#include "simulated/SimulatedServiceListeners.h"

namespace tarn {

/// A client program with one connection, for the test to drive. Hangs up when it goes.
class SimulatedClient {
public:
    using Kind = SimulatedDelivery::Kind;
    using Loss = SimulatedConnection::Loss;

    explicit SimulatedClient(SimulatedServiceListeners& service) : connection_(service.connect()) {}
    ~SimulatedClient() { hangUp(); }
    SimulatedClient(const SimulatedClient&) = delete;
    SimulatedClient& operator=(const SimulatedClient&) = delete;

    /// Calls and wants an answer; the result names the call. Calls are numbered from 1.
    std::uint64_t call(Data data);

    /// Calls and wants no answer.
    void send(Data data) { connection_->call(0, std::move(data)); }

    void hangUp() { connection_->lose(Loss::invalidated); }
    void breakOff() { connection_->lose(Loss::interrupted); }

    SimulatedConnection& connection() { return *connection_; }
    std::vector<SimulatedDelivery> deliveries() const { return connection_->deliveries(); }

    /// One line for everything that came, in order: "1: data 0a02", "2: error 25", "3: nothing",
    /// "4: released", "event 0a02". Data is shown by `describe`; as hexadecimal digits without one.
    std::vector<std::string> transcript(const std::function<std::string(const Data&)>& describe = hex) const;

    /// How a call ended, as in the transcript without its number. Nothing while it has not; more than one
    /// would be a fault of the service.
    std::vector<std::string> outcomes(std::uint64_t call) const;

    /// The only outcome of a call; empty when it has none, or more than one.
    std::string outcome(std::uint64_t call) const;

    static std::string hex(const Data& data);

private:
    const std::shared_ptr<SimulatedConnection> connection_;
    std::uint64_t lastCall_ = 0;
};

} // namespace tarn
