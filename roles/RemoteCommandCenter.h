#pragma once

#include <functional>

#include "roles/Registration.h"

namespace tarn {

enum class RemoteCommandResult { success = 0, noSuchContent = 100, commandFailed = 200 };

/// One media control of the system: a key, a headset button, a widget of the lock screen.
class RemoteCommand {
public:
    using Handler = std::function<RemoteCommandResult()>;

    virtual ~RemoteCommand() = default;

    /// `handler` runs on the thread that delivers remote commands, one after the other, and may block for 17
    /// seconds. Only the pause before the system sleeps does not wait for that: it comes on another thread.
    [[nodiscard]] virtual RegistrationHandle addTarget(Handler handler) = 0;
    virtual void setEnabled(bool enabled) = 0;
};

/// The system's media controls. One shared instance; any thread may call.
///
/// With several targets, pause goes to every one; the others go to the newest first, then to older ones until
/// one succeeds.
class RemoteCommandCenter {
public:
    virtual ~RemoteCommandCenter() = default;

    virtual RemoteCommand& pauseCommand() = 0;
    virtual RemoteCommand& playCommand() = 0;
    virtual RemoteCommand& togglePlayPauseCommand() = 0;
    virtual RemoteCommand& nextTrackCommand() = 0;
    virtual RemoteCommand& previousTrackCommand() = 0;
};

} // namespace tarn
