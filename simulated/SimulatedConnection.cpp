#include "simulated/SimulatedConnection.h"

#include <iterator>
#include <utility>

namespace tarn {

class SimulatedConnection::Call final : public Reply::Call {
public:
    Call(std::weak_ptr<SimulatedConnection> connection, std::uint64_t id)
        : connection_(std::move(connection)), id_(id) {}

    ~Call() override {
        if (!isAnswered_)
            deliver({SimulatedDelivery::Kind::released, id_, {}, {}});
    }

    void answer(std::optional<Data> data, const std::optional<Error>& error) override {
        if (!std::exchange(isAnswered_, true))
            deliver({SimulatedDelivery::Kind::answer, id_, std::move(data), error});
    }

private:
    void deliver(SimulatedDelivery delivery) {
        if (auto connection = connection_.lock())
            connection->deliver(std::move(delivery));
    }

    const std::weak_ptr<SimulatedConnection> connection_;
    const std::uint64_t id_;
    bool isAnswered_ = false;
};

SimulatedConnection::SimulatedConnection(std::shared_ptr<const SimulatedIO> io) : io_(std::move(io)) {}

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
    io_->yieldPoint();
    deliver({SimulatedDelivery::Kind::event, 0, data, {}});
}

void SimulatedConnection::call(std::uint64_t id, Data data) {
    Reply reply;
    if (id != 0)
        reply = Reply(std::make_shared<Call>(weak_from_this(), id));
    bool isSent = state_.withLocked([&](State& state) {
        if (state.loss != Loss::none)
            return false;
        state.arrived.push_back({std::move(data), std::move(reply)});
        return true;
    });
    if (isSent)
        io_->queue->async([self = shared_from_this()] { self->read(); });
}

void SimulatedConnection::lose(Loss loss) {
    bool isFirst = state_.withLocked([&](State& state) {
        return std::exchange(state.loss, state.loss == Loss::none ? loss : state.loss) == Loss::none;
    });
    if (isFirst)
        io_->queue->async([self = shared_from_this()] { self->finishLoss(); });
}

void SimulatedConnection::loseAtStep(int step, Loss loss) {
    state_.withLocked([&](State& state) {
        state.stepsToLoss = step;
        state.lossAtStep = loss;
    });
}

void SimulatedConnection::passStep() {
    Loss loss = state_.withLocked([](State& state) {
        return state.stepsToLoss > 0 && --state.stepsToLoss == 0 ? state.lossAtStep : Loss::none;
    });
    if (loss != Loss::none)
        lose(loss);
}

void SimulatedConnection::deliver(SimulatedDelivery delivery) {
    state_.withLocked([&](State& state) {
        if (state.loss == Loss::none)
            state.deliveries.push_back(std::move(delivery));
    });
}

std::vector<SimulatedDelivery> SimulatedConnection::deliveries() const {
    return state_.withLocked([](const State& state) { return state.deliveries; });
}

bool SimulatedConnection::isLost() const {
    return state_.withLocked([](const State& state) { return state.loss != Loss::none; });
}

void SimulatedConnection::read() {
    if (!resumed_ || finished_)
        return;
    if (auto calls = takeArrived(false); !calls.empty()) {
        exported_->receiveData(std::move(calls));
        io_->queue->async([self = shared_from_this()] { self->read(); });
    }
}

bool SimulatedConnection::hasUnread() const {
    return resumed_ && !finished_ && state_.withLocked([](const State& state) {
        return state.loss != Loss::interrupted && !state.arrived.empty();
    });
}

void SimulatedConnection::finishLoss() {
    if (!resumed_ || !isLost() || std::exchange(finished_, true))
        return;
    if (auto calls = takeArrived(true); !calls.empty())
        exported_->receiveData(std::move(calls));
    bool isInterrupted =
        state_.withLocked([](const State& state) { return state.loss == Loss::interrupted; });
    auto interruption = std::exchange(interruptionHandler_, nullptr);
    auto invalidation = std::exchange(invalidationHandler_, nullptr);
    exported_ = nullptr;
    (isInterrupted ? interruption : invalidation)();
}

/// A part of the calls that chance chooses, or all of them. A broken connection delivers none.
std::vector<ReceivedCall> SimulatedConnection::takeArrived(bool all) {
    return state_.withLocked([&](State& state) {
        std::vector<ReceivedCall> taken;
        if (state.loss == Loss::interrupted || state.arrived.empty())
            return taken;
        std::size_t count = all ? state.arrived.size() : 1 + io_->random(state.arrived.size());
        auto end = state.arrived.begin() + static_cast<std::ptrdiff_t>(count);
        taken.assign(std::make_move_iterator(state.arrived.begin()), std::make_move_iterator(end));
        state.arrived.erase(state.arrived.begin(), end);
        return taken;
    });
}

} // namespace tarn
