#include "client/libtarn/Mirror.h"

#include <algorithm>
#include <cmath>

#include "client/libtarn/Overloaded.h"

namespace tarn {

namespace {

using client::Event;
using Item = Mirror::Item;
using Time = Mirror::Time;

constexpr std::size_t mostGrants = 64; // what the service keeps

void setPosition(Item& item, double seconds, Time now) {
    item.position = seconds;
    item.since = now;
}

void setSpeed(Item& item, float speed, Time now) {
    setPosition(item, item.positionAt(now), now);
    item.speed = speed;
    item.heard.reset();
    item.stands = false;
}

bool contains(const Mirror::Player& player, const std::shared_ptr<Item>& item) {
    return std::ranges::find(player.queue, item) != player.queue.end();
}

/// The rate becomes 0 when a queue plays to its end, and the program may not have been told yet.
void stopIfEmpty(Mirror::Player& player) {
    if (player.queue.empty())
        player.rate = 0;
}

} // namespace

double Mirror::Item::positionAt(Time now) const {
    double place = position;
    if (!stands)
        place += speed * std::chrono::duration<double>(now - since).count();
    if (asset->duration > 0)
        place = std::min(place, asset->duration);
    return std::max(place, 0.0);
}

void Mirror::fileGranted(const std::string& token, GrantedFile file) {
    if (grants_.size() == mostGrants)
        grants_.pop_front();
    grants_.emplace_back(token, std::move(file));
}

void Mirror::assetMade(const client::AssetUpsert& asset, double duration) {
    if (asset.URL) {
        auto made = std::make_shared<Asset>(Asset{asset, std::nullopt, duration});
        made->upsert.sandboxExtensionToken.reset();
        const auto grant = std::ranges::find(grants_, asset.sandboxExtensionToken.value_or(""),
                                             &std::pair<std::string, GrantedFile>::first);
        if (grant != grants_.end()) {
            made->granted = std::move(grant->second);
            grants_.erase(grant);
        }
        assets_[asset.identifier] = std::move(made);
    } else if (const auto found = assets_.find(asset.identifier); found != assets_.end()) {
        auto& upsert = found->second->upsert;
        const auto replace = [](auto& text, const auto& by) { text = by ? by : text; };
        replace(upsert.title, asset.title);
        replace(upsert.albumTitle, asset.albumTitle);
        replace(upsert.artist, asset.artist);
    }
}

void Mirror::assetDestroyed(const std::string& asset) { assets_.erase(asset); }

void Mirror::itemMade(const std::string& item, const std::string& asset,
                      std::optional<client::Status::Value> status) {
    if (const auto found = assets_.find(asset); found != assets_.end())
        items_[item] =
            std::make_shared<Item>(Item{.identifier = item, .asset = found->second, .status = status});
}

void Mirror::itemDestroyed(const std::string& item) { items_.erase(item); }

void Mirror::playerMade(const std::string& player, const std::vector<std::string>& items, Time now) {
    playerDestroyed(player, now);
    Player made;
    for (const auto& name : items)
        if (auto item = itemNamed(name); item && !contains(made, item))
            made.queue.push_back(std::move(item));
    players_[player] = std::move(made);
}

void Mirror::playerDestroyed(const std::string& player, Time now) {
    allItemsRemoved(player, now);
    players_.erase(player);
}

void Mirror::itemAppended(const std::string& player, const std::string& item, Time now) {
    edit(player, now, [&](Player& edited) {
        if (auto found = itemNamed(item); found && !contains(edited, found))
            edited.queue.push_back(std::move(found));
    });
}

void Mirror::itemRemoved(const std::string& player, const std::string& item, Time now) {
    edit(player, now, [&](Player& edited) { std::erase(edited.queue, itemNamed(item)); });
}

void Mirror::allItemsRemoved(const std::string& player, Time now) {
    edit(player, now, [](Player& edited) { edited.queue.clear(); });
}

void Mirror::currentItemReplaced(const std::string& player, const std::string& item, Time now) {
    edit(player, now, [&](Player& edited) {
        auto found = itemNamed(item);
        if (!found || contains(edited, found))
            return;
        if (!edited.queue.empty())
            edited.queue.pop_front();
        edited.queue.push_front(std::move(found));
    });
}

void Mirror::positionMoved(const std::string& item, double seconds, Time now) {
    const auto found = itemNamed(item);
    if (!found || !std::isfinite(seconds))
        return;
    setPosition(*found, seconds, now);
    found->heard.reset();
    found->stands = false;
}

void Mirror::positionHeard(const std::string& item, double seconds, Time now) {
    const auto found = itemNamed(item);
    if (!found)
        return;
    found->stands = found->heard == seconds;
    found->heard = seconds;
    setPosition(*found, seconds, now);
}

bool Mirror::happened(const Event& event, Time now) {
    bool isNews = true;
    std::visit(
        Overloaded{[&](const client::ItemStatusChanged& it) {
                       const auto found = itemNamed(it.item);
                       if (!found)
                           return;
                       found->status = it.status.value;
                       isNews = !found->wasReady || it.status.value != client::Status::Value::readyToPlay;
                       found->wasReady = false;
                   },
                   [&](const client::ItemPlayedToEnd& it) {
                       removeEverywhere(it.item, true, now);
                       positionMoved(it.item, 0, now);
                   },
                   [&](const client::ItemFailedToPlayToEnd& it) { removeEverywhere(it.item, false, now); },
                   [&](const client::PlayerRateChanged& it) {
                       edit(it.player, now, [&](Player& player) { player.rate = it.rate; });
                   },
                   [&](const client::CurrentItemChanged& it) {
                       edit(it.player, now, [&](Player& player) { currentItemChanged(player, it.item); });
                   },
                   [](const auto&) {}},
        event);
    return isNews;
}

/// The queue goes on to that item, wherever it stands. Where it does not stand, a command that has not ended
/// yet has put it in the place of the current one.
void Mirror::currentItemChanged(Player& player, const std::optional<std::string>& item) const {
    auto& queue = player.queue;
    const bool wentOn = std::exchange(player.wentOn, false);
    if (!item) {
        if (!queue.empty() && !wentOn)
            queue.pop_front();
        if (!queue.empty() && hasName(*queue.front()))
            queue.clear();
        return;
    }
    const auto current = itemNamed(*item);
    if (!current)
        return;
    const auto found = std::ranges::find(queue, current);
    if (found == queue.end()) {
        if (!queue.empty())
            queue.pop_front();
        queue.push_front(current);
    } else {
        queue.erase(queue.begin(), found);
    }
}

void Mirror::removeEverywhere(const std::string& item, bool onlyCurrent, Time now) {
    const auto found = itemNamed(item);
    for (const auto& [name, player] : players_)
        if (onlyCurrent ? !player.queue.empty() && player.queue.front() == found : contains(player, found))
            edit(name, now, [&](Player& edited) {
                edited.wentOn = edited.queue.front() == found;
                std::erase(edited.queue, found);
                stopIfEmpty(edited);
            });
}

void Mirror::stop(Time now) {
    for (auto& [name, player] : players_)
        if (!player.queue.empty())
            setSpeed(*player.queue.front(), 0, now);
}

/// Changes a queue or its rate: the item that is the current one afterwards, and no other, moves at the rate.
template <class Edit>
void Mirror::edit(const std::string& player, Time now, Edit edit) {
    const auto found = players_.find(player);
    if (found == players_.end())
        return;
    auto& queue = found->second.queue;
    const auto before = queue.empty() ? nullptr : queue.front();
    const float rate = found->second.rate;
    edit(found->second);
    const auto after = queue.empty() ? nullptr : queue.front();
    if (before == after && rate == found->second.rate)
        return;
    if (before)
        setSpeed(*before, 0, now);
    if (after)
        setSpeed(*after, found->second.rate, now);
}

std::vector<Event> Mirror::changesSince(const Mirror& before,
                                        const std::map<std::string, client::Error>& failures) {
    auto changes = itemChangesSince(before, failures);
    for (const auto& [name, player] : before.players_) {
        const auto found = players_.find(name);
        const Player now = found == players_.end() ? Player() : found->second;
        if (const auto current = currentNameIn(now); current != before.currentNameIn(player))
            changes.emplace_back(client::CurrentItemChanged{name, current});
        if (now.rate != player.rate)
            changes.emplace_back(client::PlayerRateChanged{name, now.rate});
    }
    return changes;
}

std::vector<Event> Mirror::itemChangesSince(const Mirror& before,
                                            const std::map<std::string, client::Error>& failures) {
    using Status = client::Status;
    std::vector<Event> changes;
    for (const auto& [name, item] : before.items_) {
        if (const auto found = items_.find(name); found != items_.end()) {
            const bool wasReady = item->status == Status::Value::readyToPlay;
            const bool isReady = found->second->status == Status::Value::readyToPlay;
            found->second->wasReady = wasReady && !isReady;
            if (isReady && !wasReady)
                changes.emplace_back(client::ItemStatusChanged{name, {.value = Status::Value::readyToPlay}});
            continue;
        }
        Status status{.value = Status::Value::failed};
        if (const auto failure = failures.find(name); failure != failures.end())
            status.error = failure->second;
        changes.emplace_back(client::ItemStatusChanged{name, std::move(status)});
        if (std::ranges::any_of(before.players_,
                                [&held = item](const auto& entry) { return contains(entry.second, held); }))
            changes.emplace_back(client::ItemFailedToPlayToEnd{name});
    }
    return changes;
}

bool Mirror::hasName(const Asset& asset) const {
    const auto found = assets_.find(asset.upsert.identifier);
    return found != assets_.end() && found->second.get() == &asset;
}

bool Mirror::hasName(const Item& item) const { return itemNamed(item.identifier).get() == &item; }

std::vector<std::string> Mirror::currentItems(bool onlyPlaying) const {
    std::vector<std::string> names;
    for (const auto& [name, player] : players_)
        if (const auto current = currentNameIn(player); current && (!onlyPlaying || player.rate != 0))
            names.push_back(*current);
    return names;
}

std::shared_ptr<Item> Mirror::itemNamed(const std::string& name) const {
    const auto found = items_.find(name);
    return found == items_.end() ? nullptr : found->second;
}

std::optional<std::string> Mirror::currentNameIn(const Player& player) const {
    if (player.queue.empty() || !hasName(*player.queue.front()))
        return std::nullopt;
    return player.queue.front()->identifier;
}

} // namespace tarn
