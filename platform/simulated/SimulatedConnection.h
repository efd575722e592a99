#pragma once

#include <cstdint>
#include <string>

#include "platform/ServiceConnection.h"
#include "platform/core/LiveObjects.h"
#include "platform/simulated/SimulatedScheduler.h"

namespace tarn {

/// What the client's end of a connection got, in order.
struct SimulatedDelivery {
    enum class Kind { answer, released, event };

    Kind kind;
    std::uint64_t call = 0; // of an answer or a release
    std::optional<Data> data;
    std::optional<Error> error;
};

/// A connection between a SimulatedClient and the service. All handlers and calls run on the I/O thread.
class SimulatedConnection final : public ServiceConnection,
                                  public VLLongFormAudioClientProtocol,
                                  public std::enable_shared_from_this<SimulatedConnection> {
public:
    enum class Loss { none, invalidated, interrupted };

    SimulatedConnection(SimulatedScheduler& scheduler, std::shared_ptr<SimulatedQueue> io);

    void setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) override;
    void resume() override;
    void setInterruptionHandler(std::function<void()> handler) override;
    void setInvalidationHandler(std::function<void()> handler) override;
    VLLongFormAudioClientProtocol& remoteObjectProxy() override;

    void receiveData(const Data& data) override;

    // The client's end.

    /// Sends a call; 0 for one that wants no answer.
    void call(std::uint64_t id, Data data);

    /// The peer hangs up: what it sent before still arrives. Or the connection breaks: it does not. Only the
    /// first loss counts.
    void lose(Loss loss);

    /// Loses the connection inside the service's `step`-th call of one of the operations above, from 1.
    void loseAtStep(int step, Loss loss);

    const std::vector<SimulatedDelivery>& deliveries() const { return deliveries_; }
    bool isLost() const { return loss_ != Loss::none; }

    // The I/O thread.

    /// Hands over a part of what arrived, as one read would.
    void read();

    /// After a loss: hands over what still arrives, and runs the handler, once.
    void finishLoss();

private:
    class Callback;

    void passStep();
    void deliver(SimulatedDelivery delivery);
    void handOver(std::size_t calls);

    LiveObject<"connection"> live_;
    SimulatedScheduler& scheduler_;
    const std::shared_ptr<SimulatedQueue> io_;
    std::shared_ptr<VLLongFormAudioServerProtocol> exported_;
    std::function<void()> interruptionHandler_;
    std::function<void()> invalidationHandler_;
    bool resumed_ = false;
    bool finished_ = false; // the handler ran
    Loss loss_ = Loss::none;
    int stepsToLoss_ = 0;
    Loss lossAtStep_ = Loss::none;
    std::vector<ReceivedCall> arrived_;
    std::vector<SimulatedDelivery> deliveries_;
};

} // namespace tarn
