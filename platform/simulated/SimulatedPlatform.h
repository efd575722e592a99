#pragma once

#include "platform/core/LocalNotificationCenter.h"
#include "platform/simulated/SimulatedClock.h"
#include "platform/simulated/SimulatedLocalization.h"
#include "platform/simulated/SimulatedQueues.h"
#include "platform/simulated/SimulatedScheduler.h"
#include "platform/simulated/SimulatedServiceListeners.h"

namespace tarn {

/// Every role on one scheduler, and so on one seed.
struct SimulatedPlatform {
    explicit SimulatedPlatform(std::uint64_t seed) : scheduler(seed) {}

    /// What is left runs while the roles still are there.
    ~SimulatedPlatform() { scheduler.runUntilIdle(); }
    SimulatedPlatform(const SimulatedPlatform&) = delete;
    SimulatedPlatform& operator=(const SimulatedPlatform&) = delete;

    SimulatedScheduler scheduler;
    SimulatedClock clock{scheduler};
    SimulatedQueues queues{scheduler};
    SimulatedServiceListeners listeners{{scheduler.createQueue("I/O"),
                                         [this](std::size_t limit) { return scheduler.random(limit); },
                                         [this] { scheduler.yieldPoint(); }}};
    SimulatedLocalization localization;
    LocalNotificationCenter notifications;
};

} // namespace tarn
