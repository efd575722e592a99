#include "controls/PlayerList.h"

#include <algorithm>
#include <utility>

namespace tarn {

namespace {

bool isSame(const PlaybackState& one, const PlaybackState& other) {
    return one.rate == other.rate && one.item == other.item;
}

/// Smaller is asked first.
int rank(const PlaybackState& playback) {
    if (!playback.item)
        return 3;
    if (playback.plays())
        return 0;
    return isZeroRate(playback.rate) ? 2 : 1;
}

} // namespace

class PlayerList::Membership final : public Registration {
public:
    Membership(std::shared_ptr<Entries> entries, const ControllablePlayer* identity)
        : entries_(std::move(entries)), identity_(identity) {}

    ~Membership() override {
        Entry gone; // behind the lock
        const std::lock_guard lock(entries_->mutex);
        auto& list = entries_->lastUsedFirst;
        const auto entry = std::ranges::find(list, identity_, &Entry::identity);
        gone = std::move(*entry);
        list.erase(entry);
    }

private:
    const std::shared_ptr<Entries> entries_;
    const ControllablePlayer* const identity_;
};

RegistrationHandle PlayerList::add(std::weak_ptr<ControllablePlayer> player) {
    const auto held = player.lock();
    const PlaybackState playback = held->playback();
    const std::lock_guard lock(entries_->mutex);
    auto& list = entries_->lastUsedFirst;
    list.insert(list.begin(), {held.get(), std::move(player), playback});
    used_();
    return std::make_unique<Membership>(entries_, held.get());
}

void PlayerList::changed(const ControllablePlayer& player) { update(player, true); }

void PlayerList::moved(const ControllablePlayer& player) { update(player, false); }

void PlayerList::update(const ControllablePlayer& player, bool isUse) {
    PlaybackState playback = player.playback(); // what it displaces goes behind the lock
    const std::lock_guard lock(entries_->mutex);
    auto& list = entries_->lastUsedFirst;
    const auto entry = std::ranges::find(list, &player, &Entry::identity);
    if (entry == list.end())
        return;
    const bool same = isSame(entry->playback, playback);
    if (!same && !isUse)
        return;
    std::swap(entry->playback, playback);
    if (isUse)
        used_();
    if (!same)
        std::rotate(list.begin(), entry, std::next(entry));
}

std::vector<ListedPlayer> PlayerList::inOrder(const std::function<void()>& look) const {
    std::vector<ListedPlayer> players;
    {
        const std::lock_guard lock(entries_->mutex);
        look();
        for (const Entry& entry : entries_->lastUsedFirst)
            if (auto player = entry.player.lock())
                players.push_back({std::move(player), entry.playback});
    }
    std::ranges::stable_sort(players, {}, [](const ListedPlayer& listed) { return rank(listed.playback); });
    return players;
}

} // namespace tarn
