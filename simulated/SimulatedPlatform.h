#pragma once

#include "observation/LocalNotificationCenter.h"
#include "roles/Platform.h"
#include "simulated/SimulatedApplicationRegistry.h"
#include "simulated/SimulatedAudioSession.h"
#include "simulated/SimulatedClock.h"
#include "simulated/SimulatedEventLoop.h"
#include "simulated/SimulatedLocalization.h"
#include "simulated/SimulatedMediaEngine.h"
#include "simulated/SimulatedNowPlayingService.h"
#include "simulated/SimulatedQueues.h"
#include "simulated/SimulatedRemoteCommands.h"
#include "simulated/SimulatedSandboxExtension.h"
#include "simulated/SimulatedScheduler.h"
#include "simulated/SimulatedServiceListeners.h"

namespace tarn {

/// Every role on one scheduler, and so on one seed.
struct SimulatedPlatform {
    explicit SimulatedPlatform(std::uint64_t seed) : scheduler(seed) {}

    /// What is left runs while the roles still are there.
    ~SimulatedPlatform() {
        audioSession.failPending();
        scheduler.runUntilIdle();
    }
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
    SimulatedSandboxExtension sandboxExtensions;
    SimulatedEventLoop playerLoop{scheduler};
    SimulatedMediaEngine media{playerLoop, notifications, sandboxExtensions};
    SimulatedAudioSession audioSession{scheduler, notifications};
    SimulatedRemoteCommands remoteCommands{scheduler};
    SimulatedNowPlayingService nowPlaying;
    SimulatedApplicationRegistry applications;

    /// What the service is given.
    Platform roles() {
        return {clock,
                queues,
                listeners,
                localization,
                notifications,
                media,
                audioSession,
                sandboxExtensions,
                remoteCommands.center(),
                nowPlaying,
                applications};
    }
};

} // namespace tarn
