#pragma once

#include <functional>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "client/libtarn/Mirror.h"

namespace tarn {

/// One thing that a client asks of the service.
struct Command {
    client::Bytes envelope;

    /// Tells the mirror, once the service has carried the command out.
    std::function<void(Mirror& mirror, const client::Answer& answer, Mirror::Time now)> learn{};

    /// The queue player whose next item it asks for: the only command that may not be carried out twice.
    std::string advances{};
};

namespace commands {

Command upsertAsset(const client::AssetUpsert& asset);
Command destroyAsset(const std::string& asset);
Command upsertItem(const std::string& item, const std::string& asset);
Command destroyItem(const std::string& item);
Command currentTime(const std::string& item);
Command setCurrentTime(const std::string& item, double seconds);
Command upsertQueuePlayer(const std::string& player, const std::vector<std::string>& items);
Command destroyQueuePlayer(const std::string& player);
Command setRate(const std::string& player, float rate);
Command advanceToNextItem(const std::string& player);
Command appendItem(const std::string& player, const std::string& item);
Command removeItem(const std::string& player, const std::string& item);
Command removeAllItems(const std::string& player);
Command replaceCurrentItem(const std::string& player, const std::string& item);

} // namespace commands

} // namespace tarn
