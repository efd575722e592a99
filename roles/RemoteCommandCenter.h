#pragma once

#include <functional>
#include <memory>

#include "roles/Registration.h"

namespace tarn {

class ControllablePlayer;

enum class RemoteCommandResult { success = 0, noSuchContent = 100, commandFailed = 200 };

/// One media control of the system: a key, a headset button, a widget of the lock screen.
class RemoteCommand {
public:
    using Handler = std::function<RemoteCommandResult()>;

    virtual ~RemoteCommand() = default;

    /// `handler` carries the command out for `player`, which the command center has been given or will be. It
    /// runs on the thread that delivers remote commands, one after the other, and may block for 17 seconds.
    /// Only the pause before the system sleeps does not wait for that: it comes on another thread.
    [[nodiscard]] virtual RegistrationHandle addTarget(const ControllablePlayer& player, Handler handler) = 0;
    virtual void setEnabled(bool enabled) = 0;
};

/// The system's media controls. One shared instance; any thread may call.
///
/// A pause goes to every player. Any other command goes to one: to the one that plays, else to the one whose
/// rate or item changed last. PlayPause is a pause while anything plays.
class RemoteCommandCenter {
public:
    virtual ~RemoteCommandCenter() = default;

    virtual RemoteCommand& pauseCommand() = 0;
    virtual RemoteCommand& playCommand() = 0;
    virtual RemoteCommand& togglePlayPauseCommand() = 0;
    virtual RemoteCommand& nextTrackCommand() = 0;
    virtual RemoteCommand& previousTrackCommand() = 0;

    /// The controls are there while there is a player. Its targets are to be registered before it.
    [[nodiscard]] virtual RegistrationHandle addPlayer(std::weak_ptr<ControllablePlayer> player) = 0;

    /// The player has another rate or item, and has published so. Returns at once.
    virtual void playerChanged(const ControllablePlayer& player) = 0;

    /// Anything else of its playback() has changed. Returns at once.
    virtual void playbackChanged(const ControllablePlayer& player) = 0;
};

} // namespace tarn
