#pragma once

#include <vector>

#include "platform/ServiceListener.h"
#include "platform/simulated/SimulatedConnection.h"
#include "platform/simulated/SimulatedQueue.h"

namespace tarn {

/// The transport: one service, its I/O thread and its connections.
class SimulatedServiceListeners final : public ServiceListeners {
public:
    explicit SimulatedServiceListeners(SimulatedScheduler& scheduler)
        : scheduler_(scheduler), io_(scheduler.createQueue("I/O")) {}

    /// There is one listener at a time.
    std::unique_ptr<ServiceListener> createWithServiceName(const std::string& name) override;

    /// A client's new connection; it is offered once the listener has been resumed. Hang-ups that are there
    /// by then are handled first.
    std::shared_ptr<SimulatedConnection> connect();

    SimulatedQueue& io() { return *io_; }

private:
    class Listener;

    void offerWaiting();
    void offer(const std::shared_ptr<SimulatedConnection>& connection);

    SimulatedScheduler& scheduler_;
    const std::shared_ptr<SimulatedQueue> io_;
    Listener* listener_ = nullptr; // while the service holds it
    std::vector<std::shared_ptr<SimulatedConnection>> waiting_;
    std::vector<std::shared_ptr<SimulatedConnection>> open_;
};

} // namespace tarn
