#pragma once

#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "roles/ServiceListener.h"

namespace tarn {

/// A delegate and exported object that writes down what it is told. Calls are answered by what `answer` does
/// with them; without it they are kept.
class FakeService final : public ServiceListenerDelegate {
public:
    using Answer = std::function<void(ReceivedCall call)>;

    explicit FakeService(Answer answer = nullptr) : answer_(std::move(answer)) {}

    bool listenerShouldAcceptNewConnection(ServiceListener& listener,
                                           const std::shared_ptr<ServiceConnection>& connection) override;

    /// Waits until so many lines are in the journal and returns it: "offered", "call BODY", "interrupted",
    /// "invalidated".
    std::vector<std::string> journalOf(std::size_t lines);
    std::size_t callCount();

    /// The connection that was offered last.
    std::shared_ptr<ServiceConnection> connection();
    std::vector<ReceivedCall> takeKeptCalls();

private:
    class Exported;

    void note(std::string line);

    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<std::string> journal_;
    std::vector<ReceivedCall> kept_;
    std::size_t callCount_ = 0;
    std::shared_ptr<ServiceConnection> connection_;
    Answer answer_;
};

} // namespace tarn
