#pragma once

#include <vector>

#include "roles/ServiceListener.h"
#include "simulated/SimulatedConnection.h"

namespace tarn {

/// The transport: one service, its I/O thread and its connections. The test that drives it keeps it until
/// the I/O thread is idle.
class SimulatedServiceListeners final : public ServiceListeners {
public:
    explicit SimulatedServiceListeners(SimulatedIO io)
        : io_(std::make_shared<const SimulatedIO>(std::move(io))) {}

    /// There is one listener at a time.
    std::unique_ptr<ServiceListener> createWithServiceName(const std::string& name) override;

    /// A client's new connection; it is offered once the listener has been resumed. Hang-ups that are there
    /// by then are handled first.
    std::shared_ptr<SimulatedConnection> connect();

    /// Returns when all that clients have sent and done so far has reached the service.
    void settle();

    SerialQueue& io() { return *io_->queue; }

private:
    class Listener;

    void offerWaiting();
    void offer(const std::shared_ptr<SimulatedConnection>& connection);

    const std::shared_ptr<const SimulatedIO> io_;

    // The I/O thread only.
    Listener* listener_ = nullptr; // while the service holds it
    std::vector<std::shared_ptr<SimulatedConnection>> waiting_;
    std::vector<std::shared_ptr<SimulatedConnection>> open_;
};

} // namespace tarn
