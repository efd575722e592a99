#include "tests/schedules/CommandMix.h"

#include <limits>
#include <utility>

namespace tarn {

using commands::Command;

const std::vector<CommandMix::Row> CommandMix::rows{
    {12, &CommandMix::upsertAsset},       {3, &CommandMix::updateAsset},
    {2, &CommandMix::destroyAsset},       {14, &CommandMix::upsertItem},
    {3, &CommandMix::destroyItem},        {6, &CommandMix::getCurrentTime},
    {6, &CommandMix::setCurrentTime},     {10, &CommandMix::upsertPlayer},
    {2, &CommandMix::destroyPlayer},      {14, &CommandMix::setRate},
    {4, &CommandMix::replaceCurrentItem}, {5, &CommandMix::advanceToNextItem},
    {8, &CommandMix::appendItem},         {4, &CommandMix::removeItem},
    {1, &CommandMix::removeAllItems},
};

CommandMix::CommandMix(Random random, std::vector<std::string> files)
    : random_(std::move(random)), files_(std::move(files)) {}

Command CommandMix::next() {
    std::size_t total = 0;
    for (const Row& row : rows)
        total += row.weight;
    std::size_t place = random_(total);
    auto row = rows.begin();
    while (place >= row->weight)
        place -= (row++)->weight;
    return (this->*row->make)();
}

std::vector<Command> CommandMix::beginning() {
    std::vector<Command> all;
    for (std::size_t index = 0; index < assetCount; ++index)
        all.push_back(commands::upsertAsset({.identifier = "asset" + std::to_string(index), .URL = file()}));
    for (std::size_t index = 0; index < itemCount; ++index)
        all.push_back(commands::upsertItem("item" + std::to_string(index), asset()));
    for (std::size_t index = 0; index < playerCount; ++index) {
        all.push_back(commands::upsertPlayer("player" + std::to_string(index), {}));
        for (std::size_t count = 0; count < 3; ++count)
            all.push_back(commands::appendItem("player" + std::to_string(index), item()));
    }
    for (std::size_t count = 0; count < 2; ++count)
        all.push_back(setRate());
    return all;
}

commands::Identifier CommandMix::identifier(const std::string& kind, std::size_t count) {
    if (random_(40) == 0)
        return std::nullopt;
    return kind + std::to_string(random_(count));
}

Command CommandMix::upsertAsset() { return commands::upsertAsset({.identifier = asset(), .URL = file()}); }

Command CommandMix::updateAsset() {
    return commands::upsertAsset({.identifier = asset(), .title = "title " + std::to_string(random_(9))});
}

Command CommandMix::destroyAsset() { return commands::destroyAsset(asset()); }

Command CommandMix::upsertItem() { return commands::upsertItem(item(), asset()); }

Command CommandMix::destroyItem() { return commands::destroyItem(item()); }

Command CommandMix::getCurrentTime() { return commands::getCurrentTime(item()); }

Command CommandMix::setCurrentTime() {
    static constexpr double times[] = {0, 1, 2.5, 3.9, 1e9, -1, std::numeric_limits<double>::quiet_NaN()};
    return commands::setCurrentTime(item(), times[random_(std::size(times))]);
}

Command CommandMix::upsertPlayer() {
    std::vector<std::string> items;
    for (std::size_t count = random_(4); items.size() < count;)
        items.push_back(item().value_or("item9"));
    return commands::upsertPlayer(player(), items);
}

Command CommandMix::destroyPlayer() { return commands::destroyPlayer(player()); }

Command CommandMix::setRate() {
    static constexpr float rates[] = {1, 1,    1,  1,     0,
                                      2, 0.5F, -1, 1e-8F, std::numeric_limits<float>::infinity()};
    return commands::setRate(player(), rates[random_(std::size(rates))]);
}

Command CommandMix::replaceCurrentItem() { return commands::replaceCurrentItem(player(), item()); }

Command CommandMix::advanceToNextItem() { return commands::advanceToNextItem(player()); }

Command CommandMix::appendItem() { return commands::appendItem(player(), item()); }

Command CommandMix::removeItem() { return commands::removeItem(player(), item()); }

Command CommandMix::removeAllItems() { return commands::removeAllItems(player()); }

} // namespace tarn
