#pragma once

#include "platform/Platform.h"
#include "platform/core/LocalNotificationCenter.h"
#include "platform/simulated/SimulatedApplicationRegistry.h"
#include "platform/simulated/SimulatedAudioSession.h"
#include "platform/simulated/SimulatedClock.h"
#include "platform/simulated/SimulatedLocalization.h"
#include "platform/simulated/SimulatedNowPlayingService.h"
#include "platform/simulated/SimulatedQueues.h"
#include "platform/simulated/SimulatedRemoteCommands.h"
#include "platform/simulated/SimulatedSandboxExtension.h"
#include "platform/simulated/SimulatedScheduler.h"
#include "platform/simulated/SimulatedServiceListeners.h"
#include "platform/simulated/media/SimulatedMediaEngine.h"
#include "platform/simulated/media/SimulatedPlayerLoop.h"

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
    SimulatedPlayerLoop playerLoop{scheduler};
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
