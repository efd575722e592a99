#include "simulated/SimulatedServiceListeners.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace tarn {

class SimulatedServiceListeners::Listener final : public ServiceListener {
public:
    explicit Listener(SimulatedServiceListeners& owner) : owner_(owner) {
        owner_.io().sync([this] { owner_.listener_ = this; });
    }
    ~Listener() override {
        // The service may go with its last connection, on the I/O thread.
        auto leave = [this] { owner_.listener_ = nullptr; };
        if (owner_.io().isCurrent())
            leave();
        else
            owner_.io().sync(leave);
    }

    void setDelegate(ServiceListenerDelegate* delegate) override { delegate_ = delegate; }

    void resume() override {
        owner_.io_->queue->async([this, &owner = owner_] {
            resumed_ = true;
            owner.offerWaiting();
        });
    }

    bool isResumed() const { return resumed_; }
    ServiceListenerDelegate& delegate() { return *delegate_; }

private:
    SimulatedServiceListeners& owner_;
    ServiceListenerDelegate* delegate_ = nullptr;
    bool resumed_ = false;
};

std::unique_ptr<ServiceListener>
SimulatedServiceListeners::createWithServiceName([[maybe_unused]] const std::string& name) {
    assert(name == "ostrel.tarnd");
    return std::make_unique<Listener>(*this);
}

std::shared_ptr<SimulatedConnection> SimulatedServiceListeners::connect() {
    auto connection = std::make_shared<SimulatedConnection>(io_);
    io_->queue->async([this, connection] {
        waiting_.push_back(connection);
        offerWaiting();
    });
    return connection;
}

void SimulatedServiceListeners::settle() {
    bool hasUnread = true;
    while (hasUnread)
        io().sync([&] {
            hasUnread = std::any_of(open_.begin(), open_.end(),
                                    [](const auto& connection) { return connection->hasUnread(); });
        });
}

void SimulatedServiceListeners::offerWaiting() {
    if (listener_ == nullptr || !listener_->isResumed())
        return;
    for (const auto& connection : std::exchange(waiting_, {}))
        offer(connection);
}

void SimulatedServiceListeners::offer(const std::shared_ptr<SimulatedConnection>& connection) {
    for (const auto& open : open_)
        if (open->isLost())
            open->finishLoss();
    std::erase_if(open_, [](const auto& open) { return open->isLost(); });
    open_.push_back(connection);
    listener_->delegate().listenerShouldAcceptNewConnection(*listener_, connection);
    // What came before the connection was resumed is read now.
    io_->queue->async([connection] {
        connection->read();
        connection->finishLoss();
    });
}

} // namespace tarn
