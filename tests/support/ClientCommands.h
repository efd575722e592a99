#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "proto/AudioFilePlayerMessage.h"
#include "roles/Data.h"

/// The commands that a client can send, as the router takes them. An absent identifier is one that the client
/// left out.
namespace tarn::commands {

using Identifier = std::optional<std::string>;
using Command = std::shared_ptr<VLProtoAudioFilePlayerMessage>;

/// The arguments of an asset upsert.
struct AssetFields {
    Identifier identifier;
    std::optional<std::string> URL{};
    std::optional<std::string> title{};
    std::optional<std::string> albumTitle{};
    std::optional<std::string> artist{};
    std::optional<std::string> sandboxExtensionToken{};
};

Command upsertAsset(const AssetFields& fields);
Command destroyAsset(const Identifier& identifier);

Command upsertItem(const Identifier& identifier, const Identifier& asset);
Command destroyItem(const Identifier& identifier);
Command getCurrentTime(const Identifier& identifier);
Command setCurrentTime(const Identifier& identifier, double seconds);

Command upsertPlayer(const Identifier& identifier, const std::vector<std::string>& items);
Command destroyPlayer(const Identifier& identifier);
Command setRate(const Identifier& identifier, float rate);
Command replaceCurrentItem(const Identifier& identifier, const Identifier& item);
Command advanceToNextItem(const Identifier& identifier);
Command appendItem(const Identifier& identifier, const Identifier& item);
Command removeItem(const Identifier& identifier, const Identifier& item);
Command removeAllItems(const Identifier& identifier);

/// In its envelope, as it goes over the wire.
Data encoded(const Command& command);

} // namespace tarn::commands
