#include "platform/simulated/SimulatedConnection.h"

#include <cassert>
#include <iterator>
#include <utility>

#include "platform/simulated/SimulatedQueue.h"

namespace tarn {

/// The way back for one call; knows its own connection only.
class SimulatedConnection::Callback final : public ClientCallback {
public:
    Callback(std::weak_ptr<SimulatedConnection> connection, std::uint64_t id)
        : connection_(std::move(connection)), id_(id) {}

    ~Callback() override {
        if (!called_)
            deliver({SimulatedDelivery::Kind::released, id_, {}, {}});
    }

    void call(const std::optional<Data>& data, const std::optional<Error>& error) override {
        if (!std::exchange(called_, true))
            deliver({SimulatedDelivery::Kind::answer, id_, data, error});
    }

private:
    void deliver(SimulatedDelivery delivery) {
        if (auto connection = connection_.lock())
            connection->deliver(std::move(delivery));
    }

    const std::weak_ptr<SimulatedConnection> connection_;
    const std::uint64_t id_;
    bool called_ = false;
};

SimulatedConnection::SimulatedConnection(SimulatedScheduler& scheduler, std::shared_ptr<SimulatedQueue> io)
    : scheduler_(scheduler), io_(std::move(io)) {}

void SimulatedConnection::setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) {
    exported_ = std::move(object);
    passStep();
}

void SimulatedConnection::resume() {
    resumed_ = true;
    passStep();
}

void SimulatedConnection::setInterruptionHandler(std::function<void()> handler) {
    interruptionHandler_ = std::move(handler);
    passStep();
}

void SimulatedConnection::setInvalidationHandler(std::function<void()> handler) {
    invalidationHandler_ = std::move(handler);
    passStep();
}

VLLongFormAudioClientProtocol& SimulatedConnection::remoteObjectProxy() {
    passStep();
    return *this;
}

void SimulatedConnection::receiveData(const Data& data) {
    scheduler_.yieldPoint();
    deliver({SimulatedDelivery::Kind::event, 0, data, {}});
}

void SimulatedConnection::call(std::uint64_t id, Data data) {
    if (isLost())
        return;
    auto callback = id == 0 ? nullptr : std::make_unique<Callback>(weak_from_this(), id);
    arrived_.push_back({std::move(data), std::move(callback)});
    io_->async([self = shared_from_this()] { self->read(); });
}

void SimulatedConnection::lose(Loss loss) {
    if (isLost())
        return;
    loss_ = loss;
    io_->async([self = shared_from_this()] { self->finishLoss(); });
}

void SimulatedConnection::loseAtStep(int step, Loss loss) {
    stepsToLoss_ = step;
    lossAtStep_ = loss;
}

void SimulatedConnection::passStep() {
    if (stepsToLoss_ > 0 && --stepsToLoss_ == 0)
        lose(lossAtStep_);
}

void SimulatedConnection::deliver(SimulatedDelivery delivery) {
    if (!isLost())
        deliveries_.push_back(std::move(delivery));
}

void SimulatedConnection::read() {
    if (!resumed_ || finished_ || loss_ == Loss::interrupted || arrived_.empty())
        return;
    handOver(1 + scheduler_.random(arrived_.size()));
    io_->async([self = shared_from_this()] { self->read(); });
}

void SimulatedConnection::finishLoss() {
    if (!resumed_ || !isLost() || std::exchange(finished_, true))
        return;
    if (loss_ == Loss::invalidated && !arrived_.empty())
        handOver(arrived_.size());
    arrived_.clear();
    auto interruption = std::exchange(interruptionHandler_, nullptr);
    auto invalidation = std::exchange(invalidationHandler_, nullptr);
    exported_ = nullptr;
    const auto& handler = loss_ == Loss::interrupted ? interruption : invalidation;
    assert(handler != nullptr);
    handler();
}

void SimulatedConnection::handOver(std::size_t calls) {
    auto end = arrived_.begin() + static_cast<std::ptrdiff_t>(calls);
    std::vector<ReceivedCall> batch(std::make_move_iterator(arrived_.begin()), std::make_move_iterator(end));
    arrived_.erase(arrived_.begin(), end);
    exported_->receiveData(std::move(batch));
}

} // namespace tarn
