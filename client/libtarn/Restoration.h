#pragma once

#include <cstddef>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "client/libtarn/Command.h"
#include "client/libtarn/Mirror.h"

namespace tarn {

/// Makes the objects of a mirror again, in a service that has just been connected to and holds nothing.
///
/// It goes in waves, since an item needs its asset and a queue its items, and commands about the ones run
/// beside those about the others: a wave begins when everything of the one before is answered. What sounds
/// comes first: the first two items of each queue, their players, and the rates; then all the rest, and the
/// queues' ends. An object that has lost its name, or whose name has passed to another one, is made under a
/// name that nobody uses, which is destroyed at the end.
///
/// All calls come one at a time. What is answered after the restoration was let go is ignored.
class Restoration : public std::enable_shared_from_this<Restoration> {
public:
    using Ended = std::function<void(const client::Answer& answer)>;
    using Failures = std::map<std::string, client::Error>;

    struct Handlers {
        std::function<void(const Command& command, Ended ended)> send;
        /// Hands a file over and gives its token; none when it cannot be opened any more.
        std::function<std::optional<std::string>(const Mirror::GrantedFile& file)> grant;
        /// Everything is there again, but the items that have failed.
        std::function<void(const Failures& failures)> done;
    };

    /// The mirror stands still (stop()) and outlives the restoration.
    Restoration(const Mirror& wanted, Handlers handlers) : wanted_(wanted), handlers_(std::move(handlers)) {}

    void begin();

private:
    using Asset = Mirror::Asset;
    using Item = Mirror::Item;

    /// A command, made when its turn comes, and what its answer is for.
    struct Step {
        std::function<Command()> command;
        std::function<void(const client::Answer& answer)> answered{};
    };

    void goOn();
    void sendNext();
    void endStep(const Step& step, const client::Answer& answer);
    void addAsset(const std::shared_ptr<const Asset>& asset);
    void addItem(const std::shared_ptr<const Item>& item);
    void beginAssetsThatSound();
    void beginItemsThatSound();
    void beginPlayers();
    void beginOtherAssets();
    void beginOtherItems();
    void beginEndsOfQueues();
    void beginTakingNames();
    Command upsertOf(const Asset& asset, const std::string& name) const;
    bool isMade(const Item& item) const;
    void forEachItemThatSounds(const std::function<void(const std::shared_ptr<Item>&)>& visit) const;
    void forEachItem(const std::function<void(const std::shared_ptr<Item>&)>& visit) const;

    const Mirror& wanted_;
    const Handlers handlers_;
    std::size_t wave_ = 0;
    std::deque<Step> steps_; // of this wave, not begun
    std::size_t underWay_ = 0;
    std::map<const Asset*, std::string> assetNames_; // what they are made under
    std::map<const Item*, std::string> itemNames_;
    std::map<const Asset*, client::Error> failedAssets_;
    std::map<const Item*, client::Error> failedItems_;
    std::vector<std::string> spareAssetNames_;
    std::vector<std::string> spareItemNames_;
};

} // namespace tarn
