#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "roles/SerialQueue.h"
#include "roles/ServiceConnection.h"
#include "threads/LiveObjects.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// What the client's end of a connection got, in order.
struct SimulatedDelivery {
    enum class Kind { answer, released, event };

    Kind kind;
    std::uint64_t call = 0; // of an answer or a release
    std::optional<Data> data;
    std::optional<Error> error;
};

/// The I/O thread that serves all connections, and where chance comes in. With a queue of the scheduler it is
/// virtual; with one of WorkerQueues the same connections run on real threads.
struct SimulatedIO {
    std::shared_ptr<SerialQueue> queue;
    std::function<std::size_t(std::size_t limit)> random;
    std::function<void()> yieldPoint;
};

/// A connection between a client and the service. Handlers and calls run on the I/O thread.
class SimulatedConnection final : public ServiceConnection,
                                  public VLLongFormAudioClientProtocol,
                                  public std::enable_shared_from_this<SimulatedConnection> {
public:
    enum class Loss { none, invalidated, interrupted };

    explicit SimulatedConnection(std::shared_ptr<const SimulatedIO> io);

    void setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) override;
    void resume() override;
    void setInterruptionHandler(std::function<void()> handler) override;
    void setInvalidationHandler(std::function<void()> handler) override;
    VLLongFormAudioClientProtocol& remoteObjectProxy() override;

    void receiveData(const Data& data) override;

    // The client's end. Any thread.

    /// Sends a call; 0 for one that wants no answer.
    void call(std::uint64_t id, Data data);

    /// The peer hangs up: what it sent before still arrives. Or the connection breaks: it does not. Only the
    /// first loss counts.
    void lose(Loss loss);

    /// Loses the connection inside the service's `step`-th call of one of the operations above, from 1.
    void loseAtStep(int step, Loss loss);

    std::vector<SimulatedDelivery> deliveries() const;
    bool isLost() const;

    // The I/O thread.

    /// Hands over a part of what arrived, as one read would, and comes back for the rest.
    void read();

    /// Has something arrived that read() is still to hand over?
    bool hasUnread() const;

    /// After a loss: hands over what still arrives, and runs the handler, once.
    void finishLoss();

private:
    class Call;

    struct State {
        Loss loss = Loss::none;
        int stepsToLoss = 0;
        Loss lossAtStep = Loss::none;
        std::vector<ReceivedCall> arrived;
        std::vector<SimulatedDelivery> deliveries;
    };

    void passStep();
    void deliver(SimulatedDelivery delivery);
    std::vector<ReceivedCall> takeArrived(bool all);

    LiveObject<"connection"> live_;
    const std::shared_ptr<const SimulatedIO> io_;
    MutexProtected<State> state_;

    // The I/O thread only.
    std::shared_ptr<VLLongFormAudioServerProtocol> exported_;
    std::function<void()> interruptionHandler_;
    std::function<void()> invalidationHandler_;
    bool resumed_ = false;
    bool finished_ = false; // the handler ran
};

} // namespace tarn
