#pragma once

#include <memory>

#include "controls/LinuxMediaControls.h"
#include "controls/applications/DesktopApplicationRegistry.h"
#include "ipc/SocketListeners.h"
#include "ipc/TokenTable.h"
#include "observation/LocalNotificationCenter.h"
#include "roles/Localization.h"
#include "roles/Platform.h"
#include "service/LinuxMediaEngine.h"
#include "sound/LinuxAudioSession.h"
#include "threads/SteadyClock.h"
#include "threads/WorkerQueues.h"

namespace tarn {

/// Every role as Linux plays it. The order of the members is that of their needs.
struct LinuxPlatform {
    /// As the environment of the process says.
    LinuxPlatform();

    /// Refers to this platform, which must outlive it.
    Platform roles();

    SteadyClock clock;
    WorkerQueues queues;
    const std::unique_ptr<Localization> localization;
    LocalNotificationCenter notifications;
    TokenTable tokens;
    LinuxSound sound;
    LinuxAudioSession audioSession{sound.loop, sound.server, notifications};
    LinuxMediaEngine media{sound, notifications, tokens, audioSession};
    SocketListeners listeners{tokens, media.clientFiles()};
    const std::unique_ptr<DesktopApplicationRegistry> applications;
    LinuxMediaControls controls;
};

} // namespace tarn
