#include <tarn/Client.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <cmath>
#include <string>
#include <variant>
#include <vector>

#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using client::Client;
using client::Outcome;
using testing::ElementsAre;

const std::string player = "player,org.example.Test";

template <class... Handlers>
struct Overloaded : Handlers... {
    using Handlers::operator()...;
};
template <class... Handlers>
Overloaded(Handlers...) -> Overloaded<Handlers...>;

std::string lineOf(const client::Event& event) {
    using client::Status;
    return std::visit(
        Overloaded{
            [](const client::ItemStatusChanged& it) {
                return it.item + " is " + std::to_string(static_cast<int>(it.status.value));
            },
            [](const client::ItemTimeJumped& it) { return it.item + " jumped"; },
            [](const client::ItemPlayedToEnd& it) { return it.item + " ended"; },
            [](const client::ItemFailedToPlayToEnd& it) { return it.item + " failed"; },
            [](const client::PlayerStatusChanged&) { return std::string("player is ready"); },
            [](const client::PlayerRateChanged& it) {
                return "rate " + std::to_string(static_cast<int>(std::lround(it.rate * 100)));
            },
            [](const client::CurrentItemChanged& it) { return "now " + it.item.value_or("nothing"); },
            [](const client::ConnectionLost&) { return std::string("lost"); },
            [](const client::Reconnecting&) { return std::string("reconnecting"); },
            [](const client::Reconnected&) { return std::string("reconnected"); },
            [](const client::TakenOver&) { return std::string("taken over"); },
        },
        event);
}

/// A service that comes and goes, and a client that is to survive that.
class Reconnecting : public testing::Test {
protected:
    /// Makes an asset, an item and a file of silence of each name, and a player of the items.
    void mirror(const std::vector<std::string>& names) {
        for (const auto& name : names) {
            const auto URL = service.song(name + ".wav", 60);
            ASSERT_EQ(client.upsertAsset({.identifier = name, .URL = URL}).get().outcome, Outcome::answered);
            ASSERT_EQ(client.upsertItem(name, name).get().outcome, Outcome::answered);
        }
        ASSERT_EQ(client.upsertQueuePlayer(player, names).get().outcome, Outcome::answered);
    }

    /// What is told from now on up to that line.
    std::vector<std::string> linesUpTo(const std::string& last) {
        std::vector<std::string> lines;
        while (const auto event = client.nextEvent(20s)) {
            lines.push_back(lineOf(*event));
            if (lines.back() == last)
                return lines;
        }
        lines.emplace_back("nothing more");
        return lines;
    }

    double position(const std::string& item) { return client.currentTime(item).get().value; }

    /// Waits for the place; then the place and the time belong together.
    void waitFor(const std::string& item, double seconds) {
        while (position(item) < seconds)
            std::this_thread::yield();
    }

    ServiceUnderTest service;
    Client client{{.socketPath = service.socketPath(), .reconnectLimit = 20s}};
};

TEST_F(Reconnecting, PutsBackWhatPlayedAndTellsNothingTwice) {
    mirror({"a", "b", "c"});
    client.setCurrentTime("a", 20).get();
    client.setCurrentTime("b", 10).get();
    client.setRate(player, 1.5F).get();
    linesUpTo("rate 150");
    waitFor("a", 20.5);
    service.kill();
    const double left = position("a");
    linesUpTo("reconnecting");
    service.start();
    EXPECT_THAT(linesUpTo("reconnected"), ElementsAre("reconnected"));
    EXPECT_NEAR(position("a"), left, 0.3);
    EXPECT_NEAR(position("b"), 10, 0.01);
    waitFor("a", left + 0.5);
    client.advanceToNextItem(player);
    EXPECT_THAT(linesUpTo("now b"), ElementsAre("now b"));
    client.advanceToNextItem(player);
    EXPECT_THAT(linesUpTo("now c"), testing::Contains("now c"));
}

} // namespace
} // namespace tarn
