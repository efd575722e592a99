#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>

#include "roles/RemoteCommandCenter.h"

namespace tarn {

enum class RemoteCommandKind : std::uint8_t { pause, play, togglePlayPause, nextTrack, previousTrack };

/// Who answers the media controls, and who of them gets a command: pause goes to every target, newest first,
/// and succeeds when one of them does; the others go to the newest target, then to older ones until one
/// succeeds, and otherwise have the newest one's result.
///
/// Every command center is one of these with something in front of it that calls deliver(). Any thread may
/// call. Registrations may outlive it.
class RemoteTargets final : public RemoteCommandCenter {
public:
    /// `changed` runs after a command has gained its first target, lost its last one, or was enabled or
    /// disabled, on the thread that did it, with no lock held; it may run until the last registration is
    /// gone.
    explicit RemoteTargets(const std::function<void()>& changed = nullptr);
    ~RemoteTargets() override;

    RemoteCommand& pauseCommand() override;
    RemoteCommand& playCommand() override;
    RemoteCommand& togglePlayPauseCommand() override;
    RemoteCommand& nextTrackCommand() override;
    RemoteCommand& previousTrackCommand() override;

    /// Is the command enabled and has it a target?
    bool offers(RemoteCommandKind kind) const;

    /// Runs the handlers on the calling thread: the one that delivers remote commands, or, for an urgent
    /// pause, another one beside it. A target that goes meanwhile is not asked any more. What is not offered
    /// has no such content.
    RemoteCommandResult deliver(RemoteCommandKind kind);

private:
    class Command;

    Command& command(RemoteCommandKind kind) const { return *commands_[static_cast<std::size_t>(kind)]; }

    std::array<std::unique_ptr<Command>, 5> commands_;
};

} // namespace tarn
