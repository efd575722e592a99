#include "client/libtarn/Restoration.h"

#include <array>
#include <utility>

#include "client/libtarn/Token.h"

namespace tarn {

namespace {

using client::Answer;
using client::Outcome;

/// Commands that wait for their answer; fewer than the tokens that the service keeps.
constexpr std::size_t mostUnderWay = 32;

/// Of a queue: the second one makes sure that there is no gap at the end of the first.
constexpr std::size_t itemsThatSound = 2;

} // namespace

void Restoration::begin() { goOn(); }

void Restoration::goOn() {
    static constexpr std::array waves = {
        &Restoration::beginAssetsThatSound, &Restoration::beginItemsThatSound,
        &Restoration::beginPlayers,         &Restoration::beginOtherAssets,
        &Restoration::beginOtherItems,      &Restoration::beginEndsOfQueues,
        &Restoration::beginTakingNames};
    while (true) {
        while (!steps_.empty() && underWay_ < mostUnderWay)
            sendNext();
        if (underWay_ > 0)
            return;
        if (wave_ == waves.size())
            break;
        (this->*waves.at(wave_++))();
    }
    Failures failures;
    for (const auto& [item, error] : failedItems_)
        if (wanted_.hasName(*item))
            failures[item->identifier] = error;
    handlers_.done(failures);
}

void Restoration::sendNext() {
    const Step step = std::move(steps_.front());
    steps_.pop_front();
    ++underWay_;
    handlers_.send(step.command(), [weak = weak_from_this(), step](const Answer& answer) {
        if (const auto self = weak.lock())
            self->endStep(step, answer);
    });
}

void Restoration::endStep(const Step& step, const Answer& answer) {
    --underWay_;
    if (step.answered)
        step.answered(answer);
    goOn();
}

void Restoration::beginAssetsThatSound() {
    forEachItemThatSounds([this](const auto& item) { addAsset(item->asset); });
}

void Restoration::beginItemsThatSound() {
    forEachItemThatSounds([this](const auto& item) { addItem(item); });
}

void Restoration::beginPlayers() {
    for (const auto& [name, player] : wanted_.players()) {
        std::vector<std::string> items;
        for (std::size_t i = 0; i < player.queue.size() && i < itemsThatSound; ++i)
            if (isMade(*player.queue[i]))
                items.push_back(itemNames_.at(player.queue[i].get()));
        steps_.push_back({[=, name = name] { return commands::upsertQueuePlayer(name, items); }});
        if (player.rate != 0)
            steps_.push_back({[name = name, rate = player.rate] { return commands::setRate(name, rate); }});
    }
}

void Restoration::beginOtherAssets() {
    for (const auto& [name, asset] : wanted_.assets())
        addAsset(asset);
    forEachItem([this](const auto& item) { addAsset(item->asset); });
}

void Restoration::beginOtherItems() {
    forEachItem([this](const auto& item) { addItem(item); });
}

void Restoration::beginEndsOfQueues() {
    for (const auto& [name, player] : wanted_.players())
        for (std::size_t i = itemsThatSound; i < player.queue.size(); ++i)
            if (isMade(*player.queue[i]))
                steps_.push_back({[name = name, item = itemNames_.at(player.queue[i].get())] {
                    return commands::appendItem(name, item);
                }});
}

void Restoration::beginTakingNames() {
    for (const auto& name : spareItemNames_)
        steps_.push_back({[name] { return commands::destroyItem(name); }});
    for (const auto& name : spareAssetNames_)
        steps_.push_back({[name] { return commands::destroyAsset(name); }});
}

void Restoration::addAsset(const std::shared_ptr<const Asset>& asset) {
    if (assetNames_.contains(asset.get()))
        return;
    const auto name = wanted_.hasName(*asset) ? asset->upsert.identifier
                                              : spareAssetNames_.emplace_back("restored-" + makeToken());
    assetNames_[asset.get()] = name;
    steps_.push_back({[this, asset, name] { return upsertOf(*asset, name); },
                      [this, asset](const Answer& answer) {
                          if (answer.outcome != Outcome::answered)
                              failedAssets_[asset.get()] = answer.error;
                      }});
}

Command Restoration::upsertOf(const Asset& asset, const std::string& name) const {
    auto upsert = asset.upsert;
    upsert.identifier = name;
    if (asset.granted)
        upsert.sandboxExtensionToken = handlers_.grant(*asset.granted);
    return commands::upsertAsset(upsert);
}

void Restoration::addItem(const std::shared_ptr<const Item>& item) {
    if (itemNames_.contains(item.get()))
        return;
    const auto name =
        wanted_.hasName(*item) ? item->identifier : spareItemNames_.emplace_back("restored-" + makeToken());
    itemNames_[item.get()] = name;
    if (const auto failed = failedAssets_.find(item->asset.get()); failed != failedAssets_.end()) {
        failedItems_[item.get()] = failed->second;
        return;
    }
    steps_.push_back(
        {[name, asset = assetNames_.at(item->asset.get())] { return commands::upsertItem(name, asset); },
         [this, item](const Answer& answer) {
             if (answer.outcome != Outcome::answered)
                 failedItems_[item.get()] = answer.error;
         }});
    if (item->position > 0)
        steps_.push_back(
            {[name, position = item->position] { return commands::setCurrentTime(name, position); }});
}

bool Restoration::isMade(const Item& item) const {
    return itemNames_.contains(&item) && !failedItems_.contains(&item);
}

void Restoration::forEachItemThatSounds(
    const std::function<void(const std::shared_ptr<Item>&)>& visit) const {
    for (const auto& [name, player] : wanted_.players())
        for (std::size_t i = 0; i < player.queue.size() && i < itemsThatSound; ++i)
            visit(player.queue[i]);
}

void Restoration::forEachItem(const std::function<void(const std::shared_ptr<Item>&)>& visit) const {
    for (const auto& [name, item] : wanted_.items())
        visit(item);
    for (const auto& [name, player] : wanted_.players())
        for (const auto& item : player.queue)
            visit(item);
}

} // namespace tarn
