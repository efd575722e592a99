#pragma once

#include <chrono>
#include <cstddef>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <vector>

#include "roles/AudioSession.h"
#include "roles/NotificationCenter.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

/// A session that activates as the test has it, and is interrupted when the test says so. Its own thread is
/// one of the scheduler's.
class SimulatedAudioSession final : public AudioSession {
public:
    /// How one activation goes.
    struct Activation {
        std::chrono::nanoseconds after{0}; ///< from the request on
        bool never = false;                ///< not before failPending()
        bool twice = false;                ///< as no session should, completes a second time
        std::optional<Error> error{};      ///< none is success
    };

    SimulatedAudioSession(SimulatedScheduler& scheduler, NotificationCenter& notifications);

    // What happens.
    /// How the next activation that nothing is said about yet goes. Beyond that they succeed at once.
    void willActivate(Activation activation) { activations_.push_back(std::move(activation)); }

    /// The error of every setCategory() from now on; none is success.
    void setCategoryError(std::optional<Error> error) { categoryError_ = std::move(error); }

    void beginInterruption();

    /// Without options when `options` is none.
    void endInterruption(std::optional<std::uint64_t> options);

    /// Completes what was never going to, with an error, as the end of the session's server does.
    void failPending();

    // What happened.
    std::size_t activationRequests() const { return activationRequests_; }
    std::uint64_t activationOptions() const { return activationOptions_; } ///< of the last request

    struct CategorySetting {
        Category category;
        Mode mode;
        RouteSharingPolicy policy;
        std::uint64_t options;
        bool operator==(const CategorySetting&) const = default;
    };
    const std::vector<CategorySetting>& categorySettings() const { return categorySettings_; }

    std::optional<Error> setCategory(Category category, Mode mode, RouteSharingPolicy policy,
                                     std::uint64_t options) override;
    void activateWithOptions(std::uint64_t options, ActivationCompletion completion) override;

private:
    void post(std::map<std::string, std::uint64_t, std::less<>> info);
    void complete(Activation activation, ActivationCompletion completion);

    SimulatedScheduler& scheduler_;
    NotificationCenter& notifications_;
    const std::shared_ptr<SimulatedQueue> thread_;
    std::deque<Activation> activations_;
    std::optional<Error> categoryError_;
    std::size_t activationRequests_ = 0;
    std::uint64_t activationOptions_ = 0;
    std::vector<CategorySetting> categorySettings_;
    std::vector<ActivationCompletion> neverCompleted_;
    std::map<std::size_t, RegistrationHandle> timers_; // by request
};

} // namespace tarn
