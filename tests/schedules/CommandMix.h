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

    Identifier asset() { return identifier("asset", 4); }
    Identifier item() { return identifier("item", 6); }
    Identifier player() { return identifier("player", 3); }
    Identifier identifier(const std::string& kind, std::size_t count);

    Random random_;
    std::vector<std::string> files_;
};

} // namespace tarn
