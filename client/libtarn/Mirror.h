#pragma once

#include <chrono>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <tarn/Client.h>

#include "system/FileDescriptor.h"

namespace tarn {

/// What the service holds for a client: its assets, items and queue players, as far as the client can know.
///
/// The service keeps nothing over its end, so a client that is to survive that has to remember all of it. The
/// mirror learns from two sources: commands, once the service says that it has carried them out, and events,
/// which tell what happened by itself. A command that has not ended has not changed the mirror, whatever the
/// service may have done; so it can simply be sent again to a service that was put back as the mirror says.
///
/// Names and objects are different things, as in the service: an upsert puts a new object under a name, a
/// destroy takes a name away, and queues go on playing objects that have lost their name. Only objects that
/// something still reaches are kept.
///
/// Positions are known from what was last heard, from then on by the clock. Not thread-safe.
class Mirror {
public:
    using Time = std::chrono::steady_clock::time_point;

    /// A file that the program has opened for the service.
    struct GrantedFile {
        std::string path;
        std::shared_ptr<const FileDescriptor> file; ///< null: to be opened again by its path
    };

    struct Asset {
        client::AssetUpsert upsert; ///< without a token
        std::optional<GrantedFile> granted;
        double duration = 0; ///< seconds; 0 when it is not known
    };

    struct Item {
        std::string identifier; ///< which may have passed to another item
        std::shared_ptr<const Asset> asset;
        std::optional<client::Status::Value> status;

        /// In seconds, between 0 and the duration.
        double positionAt(Time now) const;

        double position = 0;           ///< seconds, at the time `since`
        Time since{};                  ///
        float speed = 0;               ///< seconds a second from then on
        std::optional<double> heard{}; ///< what the service said last, since the speed changed
        bool stands = false;           ///< it said the same again: the file does not come
        bool wasReady = false;         ///< the program was told so before the service was lost
    };

    struct Player {
        std::deque<std::shared_ptr<Item>> queue; ///< the current item first
        float rate = 0;
        bool wentOn = false; ///< the end of the item before was told, its follower not yet
    };

    // What the program has asked for, once it is done.

    /// A token that the service knows now.
    void fileGranted(const std::string& token, GrantedFile file);
    void assetMade(const client::AssetUpsert& asset, double duration);
    void assetDestroyed(const std::string& asset);
    void itemMade(const std::string& item, const std::string& asset,
                  std::optional<client::Status::Value> status);
    void itemDestroyed(const std::string& item);
    void playerMade(const std::string& player, const std::vector<std::string>& items, Time now);
    void playerDestroyed(const std::string& player, Time now);
    void itemAppended(const std::string& player, const std::string& item, Time now);
    void itemRemoved(const std::string& player, const std::string& item, Time now);
    void allItemsRemoved(const std::string& player, Time now);
    void currentItemReplaced(const std::string& player, const std::string& item, Time now);
    void positionMoved(const std::string& item, double seconds, Time now);

    /// The service was asked for the position.
    void positionHeard(const std::string& item, double seconds, Time now);

    /// An event. False when it says what the program was told already before changesSince().
    bool happened(const client::Event& event, Time now);

    /// Nothing plays from now on: positions stay as they are.
    void stop(Time now);

    /// Events that tell a program how this differs from what it was told of, `before`, by which this was put
    /// back. `failures` has the items that could not be made again, with the reason.
    std::vector<client::Event> changesSince(const Mirror& before,
                                            const std::map<std::string, client::Error>& failures);

    // What is remembered.
    const std::map<std::string, std::shared_ptr<Asset>>& assets() const { return assets_; }
    const std::map<std::string, std::shared_ptr<Item>>& items() const { return items_; }
    const std::map<std::string, Player>& players() const { return players_; }
    bool hasName(const Asset& asset) const;
    bool hasName(const Item& item) const;
    /// Tokens that no asset has used, the oldest first, and at most as many as the service keeps.
    const std::deque<std::pair<std::string, GrantedFile>>& grants() const { return grants_; }
    /// The names of all current items, or only of those that play.
    std::vector<std::string> currentItems(bool onlyPlaying) const;

private:
    std::shared_ptr<Item> itemNamed(const std::string& name) const;
    template <class Edit>
    void edit(const std::string& player, Time now, Edit edit);
    void removeEverywhere(const std::string& item, bool onlyCurrent, Time now);
    void currentItemChanged(Player& player, const std::optional<std::string>& item) const;
    std::optional<std::string> currentNameIn(const Player& player) const;
    std::vector<client::Event> itemChangesSince(const Mirror& before,
                                                const std::map<std::string, client::Error>& failures);

    std::map<std::string, std::shared_ptr<Asset>> assets_;
    std::map<std::string, std::shared_ptr<Item>> items_;
    std::map<std::string, Player> players_;
    std::deque<std::pair<std::string, GrantedFile>> grants_;
};

} // namespace tarn
