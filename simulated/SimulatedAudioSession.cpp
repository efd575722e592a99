#include "simulated/SimulatedAudioSession.h"

#include <utility>

#include "simulated/SimulatedQueue.h"

namespace tarn {

SimulatedAudioSession::SimulatedAudioSession(SimulatedScheduler& scheduler, NotificationCenter& notifications)
    : scheduler_(scheduler), notifications_(notifications), thread_(scheduler.createQueue("session")) {}

std::optional<Error> SimulatedAudioSession::setCategory(Category category, Mode mode,
                                                        RouteSharingPolicy policy, std::uint64_t options) {
    categorySettings_.push_back({category, mode, policy, options});
    return categoryError_;
}

void SimulatedAudioSession::activateWithOptions(std::uint64_t options, ActivationCompletion completion) {
    ++activationRequests_;
    activationOptions_ = options;
    Activation activation;
    if (!activations_.empty()) {
        activation = std::move(activations_.front());
        activations_.pop_front();
    }
    if (activation.never)
        neverCompleted_.push_back(std::move(completion));
    else
        complete(std::move(activation), std::move(completion));
}

void SimulatedAudioSession::complete(Activation activation, ActivationCompletion completion) {
    auto after = activation.after;
    auto work = [activation = std::move(activation), completion = std::move(completion)] {
        for (int call = 0; call < (activation.twice ? 2 : 1); ++call)
            completion(!activation.error, activation.error);
    };
    if (after == std::chrono::nanoseconds(0)) {
        thread_->async(std::move(work));
        return;
    }
    std::size_t id = activationRequests_;
    timers_[id] = scheduler_.at(scheduler_.now() + after, thread_, [this, id, work = std::move(work)] {
        work();
        timers_.erase(id);
    });
}

void SimulatedAudioSession::failPending() {
    Error error{"SimulatedAudioSession", 1, {{localizedDescriptionKey, "The sound server is gone."}}};
    for (auto& completion : std::exchange(neverCompleted_, {}))
        complete({.error = error}, std::move(completion));
}

void SimulatedAudioSession::beginInterruption() { post({{interruptionTypeKey, interruptionBegan}}); }

void SimulatedAudioSession::endInterruption(std::optional<std::uint64_t> options) {
    std::map<std::string, std::uint64_t, std::less<>> info{{interruptionTypeKey, interruptionEnded}};
    if (options)
        info.emplace(interruptionOptionsKey, *options);
    post(std::move(info));
}

void SimulatedAudioSession::post(std::map<std::string, std::uint64_t, std::less<>> info) {
    thread_->async([this, info = std::move(info)] {
        notifications_.post(
            {.name = interruptionNotification, .sender = static_cast<AudioSession*>(this), .info = info});
    });
}

} // namespace tarn
