#include "tests/ipc/FakeService.h"

#include <chrono>
#include <utility>

namespace tarn {

class FakeService::Exported final : public VLLongFormAudioServerProtocol {
public:
    explicit Exported(FakeService& service) : service_(service) {}

    void receiveData(std::vector<ReceivedCall> calls) override {
        for (auto& call : calls) {
            const std::string body(call.data.begin(), call.data.end());
            if (service_.answer_) {
                count();
                service_.answer_(std::move(call));
            } else {
                keep(std::move(call));
            }
            service_.note("call " + body);
        }
    }

private:
    void count() {
        std::lock_guard lock(service_.mutex_);
        ++service_.callCount_;
    }

    void keep(ReceivedCall call) {
        std::lock_guard lock(service_.mutex_);
        ++service_.callCount_;
        service_.kept_.push_back(std::move(call));
    }

    FakeService& service_;
};

bool FakeService::listenerShouldAcceptNewConnection(ServiceListener&,
                                                    const std::shared_ptr<ServiceConnection>& connection) {
    connection->setExportedObject(std::make_shared<Exported>(*this));
    connection->resume();
    connection->setInterruptionHandler([this] { note("interrupted"); });
    connection->setInvalidationHandler([this] { note("invalidated"); });
    {
        std::lock_guard lock(mutex_);
        connection_ = connection;
    }
    note("offered");
    return true;
}

void FakeService::note(std::string line) {
    std::lock_guard lock(mutex_);
    journal_.push_back(std::move(line));
    changed_.notify_all();
}

std::vector<std::string> FakeService::journalOf(std::size_t lines) {
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, std::chrono::seconds(10), [&] { return journal_.size() >= lines; });
    return journal_;
}

std::size_t FakeService::callCount() {
    std::lock_guard lock(mutex_);
    return callCount_;
}

std::shared_ptr<ServiceConnection> FakeService::connection() {
    std::lock_guard lock(mutex_);
    return connection_;
}

std::vector<ReceivedCall> FakeService::takeKeptCalls() {
    std::lock_guard lock(mutex_);
    return std::exchange(kept_, {});
}

} // namespace tarn
