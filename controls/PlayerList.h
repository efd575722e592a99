#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include "roles/ControllablePlayer.h"
#include "roles/Registration.h"

namespace tarn {

/// A player with what it told last of what it does.
struct ListedPlayer {
    std::shared_ptr<ControllablePlayer> player;
    PlaybackState playback;
};

/// The queue players that the media controls can act on, and which of them they act on. Any thread may call;
/// registrations may outlive the list.
///
/// Several players may live at once, and nothing hinders them from playing at once. A press of a button is
/// meant for what is heard; when nothing is, for what was dealt with last, since that is what is shown. So
/// the list is kept in the order of last use: a player comes to its front when it is registered, and whenever
/// its rate or its item changes. Of that order, players that play come first, then those that would if they
/// were not held, and those without an item last.
///
/// A player publishes what it plays after its rate or item has changed, on one thread, while the sound
/// follows the change on another. Both are to be seen together or not at all. So another rate or item counts
/// from changed() on, which comes behind the publication, and until then moved() is ignored; and what was
/// published meanwhile is shown from `used` on, which runs in the same step.
class PlayerList {
public:
    /// `used` runs under the lock of the list, when a player has been registered or has changed.
    explicit PlayerList(std::function<void()> used) : used_(std::move(used)) {}

    [[nodiscard]] RegistrationHandle add(std::weak_ptr<ControllablePlayer> player);

    /// Its rate or item has changed.
    void changed(const ControllablePlayer& player);

    /// Something else has.
    void moved(const ControllablePlayer& player);

    /// The first is the one to act on. `look` runs under the lock, for what belongs to it.
    std::vector<ListedPlayer> inOrder(const std::function<void()>& look = [] {}) const;

private:
    struct Entry {
        const ControllablePlayer* identity; // never followed
        std::weak_ptr<ControllablePlayer> player;
        PlaybackState playback;
    };

    struct Entries {
        mutable std::mutex mutex;
        std::vector<Entry> lastUsedFirst;
    };

    class Membership;

    void update(const ControllablePlayer& player, bool isUse);

    const std::function<void()> used_;
    const std::shared_ptr<Entries> entries_ = std::make_shared<Entries>();
};

} // namespace tarn
