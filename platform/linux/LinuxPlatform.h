#pragma once

#include <memory>

#include "platform/Localization.h"
#include "platform/Platform.h"
#include "platform/core/LocalNotificationCenter.h"
#include "platform/core/SteadyClock.h"
#include "platform/core/WorkerQueues.h"
#include "platform/linux/controls/LinuxMediaControls.h"
#include "platform/linux/controls/applications/DesktopApplicationRegistry.h"
#include "platform/linux/ipc/SocketListeners.h"
#include "platform/linux/ipc/TokenTable.h"
#include "platform/linux/media/LinuxAudioSession.h"
#include "platform/linux/media/LinuxMediaEngine.h"

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
    SocketListeners listeners{tokens};
    LinuxAudioSession audioSession{notifications};
    LinuxMediaEngine media{notifications, tokens, audioSession};
    const std::unique_ptr<DesktopApplicationRegistry> applications;
    LinuxMediaControls controls;
};

} // namespace tarn
