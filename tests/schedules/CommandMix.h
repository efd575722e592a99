#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

#include "tests/support/ClientCommands.h"

namespace tarn {

/// Makes the commands of a restless client: few objects and many commands, so that they meet. Now and then an
/// identifier is unknown or left out, a file does not open, and a number is not one.
class CommandMix {
public:
    /// A number below the limit, as the seed of the run has it.
    using Random = std::function<std::size_t(std::size_t limit)>;

    /// `files` are the URLs that assets are made from.
    CommandMix(Random random, std::vector<std::string> files);

    commands::Command next();

    /// What a client sends first: everything that it has, and that a part of it is to play. Without it,
    /// hardly any of the commands that follow would come upon an object.
    std::vector<commands::Command> beginning();

private:
    using Identifier = commands::Identifier;

    struct Row {
        std::size_t weight;
        commands::Command (CommandMix::*make)();
    };
    static const std::vector<Row> rows;

    commands::Command upsertAsset();
    commands::Command updateAsset();
    commands::Command destroyAsset();
    commands::Command upsertItem();
    commands::Command destroyItem();
    commands::Command getCurrentTime();
    commands::Command setCurrentTime();
    commands::Command upsertPlayer();
    commands::Command destroyPlayer();
    commands::Command setRate();
    commands::Command replaceCurrentItem();
    commands::Command advanceToNextItem();
    commands::Command appendItem();
    commands::Command removeItem();
    commands::Command removeAllItems();

    static constexpr std::size_t assetCount = 4;
    static constexpr std::size_t itemCount = 6;
    static constexpr std::size_t playerCount = 3;

    std::string file() { return files_[random_(files_.size())]; }
    Identifier asset() { return identifier("asset", assetCount); }
    Identifier item() { return identifier("item", itemCount); }
    Identifier player() { return identifier("player", playerCount); }
    Identifier identifier(const std::string& kind, std::size_t count);

    Random random_;
    std::vector<std::string> files_;
};

} // namespace tarn
