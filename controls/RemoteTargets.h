#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "controls/PlayerList.h"
#include "roles/RemoteCommandCenter.h"

namespace tarn {

enum class RemoteCommandKind : std::uint8_t { pause, play, togglePlayPause, nextTrack, previousTrack };

/// Who answers the media controls, and who of them gets a command: the rules of RemoteCommandCenter, without
/// the buttons. Any thread may call. Registrations may outlive it.
///
/// Every command center is one of these with something in front of it that calls deliver().
class RemoteTargets final : public RemoteCommandCenter {
public:
    /// `changed` runs whenever a player has come, changed or gone, on the thread that did it and with no lock
    /// held, until the last registration is gone. `used` is that of the list of players.
    explicit RemoteTargets(
        std::function<void()> changed = [] {}, std::function<void()> used = [] {});
    ~RemoteTargets() override;

    RemoteCommand& pauseCommand() override;
    RemoteCommand& playCommand() override;
    RemoteCommand& togglePlayPauseCommand() override;
    RemoteCommand& nextTrackCommand() override;
    RemoteCommand& previousTrackCommand() override;

    RegistrationHandle addPlayer(std::weak_ptr<ControllablePlayer> player) override;
    void playerChanged(const ControllablePlayer& player) override;
    void playbackChanged(const ControllablePlayer& player) override;

    /// The players with what they told last; the first is the one that commands go to.
    std::vector<ListedPlayer> players(const std::function<void()>& look = [] {}) const {
        return players_.inOrder(look);
    }

    /// Runs the handlers on the calling thread: the one that delivers remote commands, or, for an urgent
    /// pause, another one beside it. A pause succeeds when one of the players could pause. Without a player,
    /// or while the command is disabled, there is no such content.
    RemoteCommandResult deliver(RemoteCommandKind kind);

private:
    class Command;
    class PlayerRegistration;

    Command& command(RemoteCommandKind kind) const { return *commands_[static_cast<std::size_t>(kind)]; }

    const std::function<void()> changed_;
    PlayerList players_;
    std::array<std::unique_ptr<Command>, 5> commands_;
};

} // namespace tarn
