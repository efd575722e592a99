#include <tarn/Client.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using client::Client;
using client::Outcome;
using testing::ElementsAre;

const std::string player = "player,org.example.Test";

/// A service that comes and goes, and a client that is to survive that.
class Reconnecting : public testing::Test {
protected:
    client::AssetUpsert file(const std::string& name) {
        return {.identifier = name, .URL = service.song(name + ".wav", 60)};
    }

    /// Makes a file of silence, an asset and an item of each name, and a player of the items.
    void mirror(const std::vector<std::string>& names) {
        for (const auto& name : names) {
            ASSERT_EQ(client.upsertAsset(file(name)).get().outcome, Outcome::answered);
            ASSERT_EQ(client.upsertItem(name, name).get().outcome, Outcome::answered);
        }
        ASSERT_EQ(client.upsertQueuePlayer(player, names).get().outcome, Outcome::answered);
    }

    /// What is told from now on, up to that line.
    static std::vector<std::string> linesUpTo(const std::string& last, Client& client) {
        std::vector<std::string> lines;
        while (const auto event = client.nextEvent(20s)) {
            lines.push_back(describe(*event));
            if (lines.back() == last)
                return lines;
        }
        lines.push_back("and not \"" + last + "\"");
        return lines;
    }
    std::vector<std::string> linesUpTo(const std::string& last) { return linesUpTo(last, client); }

    /// The same without what is told of items that can be played: that comes when it comes.
    std::vector<std::string> changesUpTo(const std::string& last, Client& of) {
        auto lines = linesUpTo(last, of);
        std::erase_if(lines, [](const auto& line) {
            return line.ends_with("not opened yet") || line.ends_with("ready to play");
        });
        return lines;
    }

    double position(const std::string& item) { return client.currentTime(item).get().value; }

    void waitFor(const std::string& item, double seconds) {
        while (position(item) < seconds)
            std::this_thread::yield();
    }

    /// What the queue goes on to, step by step.
    std::vector<std::string> nextItems(int steps, const std::string& last = player + ": now nothing") {
        for (int i = 0; i < steps; ++i)
            client.advanceToNextItem(player).get();
        std::vector<std::string> items;
        for (const auto& line : linesUpTo(last))
            if (line.starts_with(player))
                items.push_back(line.substr(player.size() + 2));
        return items;
    }

    ServiceUnderTest service;
    Client client{{.socketPath = service.socketPath(), .reconnectLimit = 20s}};
};

TEST_F(Reconnecting, PutsBackWhatPlaysAndTellsNothingTwice) {
    mirror({"a", "b"});
    client.setCurrentTime("a", 20).get();
    client.setCurrentTime("b", 10).get();
    client.setRate(player, 1.5F).get();
    waitFor("a", 20.5);
    service.kill();
    linesUpTo("reconnecting");
    const double left = position("a");
    service.start();
    EXPECT_THAT(linesUpTo("reconnected"), ElementsAre("reconnected"));
    EXPECT_NEAR(position("a"), left, 0.3);
    EXPECT_NEAR(position("b"), 10, 0.01);
    waitFor("a", left + 0.2);
    client.setRate(player, 0).get();
    EXPECT_THAT(linesUpTo(player + ": rate 0"), ElementsAre(player + ": rate 0"));
    // Paused it stays paused, with everything that nobody plays.
    service.kill();
    service.start();
    EXPECT_THAT(linesUpTo("reconnected"), ElementsAre("reconnecting", "reconnected"));
    client.setRate(player, 1).get();
    EXPECT_THAT(linesUpTo(player + ": rate 1"), ElementsAre(player + ": rate 1"));
}

TEST_F(Reconnecting, CarriesOutOnceWhatWasUnderWayAndWhatIsGivenMeanwhile) {
    mirror({"a", "b", "c"});
    ASSERT_EQ(client.upsertAsset(file("d")).get().outcome, Outcome::answered);
    service.process().signal(SIGSTOP);
    auto item = client.upsertItem("d", "d");
    auto moved = client.setCurrentTime("b", 30);
    auto advanced = client.advanceToNextItem(player);
    service.kill();
    linesUpTo("reconnecting");
    auto appended = client.appendItem(player, "d");
    auto refused = client.appendItem(player, "nobody");
    service.start();
    EXPECT_EQ(item.get().outcome, Outcome::answered);
    EXPECT_EQ(moved.get().outcome, Outcome::released);
    EXPECT_EQ(advanced.get().outcome, Outcome::released);
    EXPECT_EQ(appended.get().outcome, Outcome::released);
    EXPECT_EQ(refused.get().error.code, 26);
    EXPECT_NEAR(position("b"), 30, 0.01);
    linesUpTo(player + ": now b");
    EXPECT_THAT(nextItems(3), ElementsAre("now c", "now d", "now nothing"));
}

TEST_F(Reconnecting, KeepsTheQueueAsItWasEditedAndObjectsThatLostTheirNames) {
    mirror({"a", "b", "c", "d"});
    client.removeItem(player, "b").get();
    client.upsertItem("e", "d").get();
    client.replaceCurrentItem(player, "e").get();
    // The queue goes on to the items that were called c and d when they came into it.
    client.upsertItem("c", "a").get();
    client.destroyItem("d").get();
    client.destroyAsset("d").get();
    service.kill();
    service.start();
    linesUpTo("reconnected");
    EXPECT_EQ(client.currentTime("d").get().error.code, 26);
    EXPECT_EQ(client.appendItem(player, "c").get().outcome, Outcome::released);
    EXPECT_THAT(nextItems(3, player + ": now c"), ElementsAre("now nothing", "now nothing", "now c"));
}

TEST_F(Reconnecting, WaitsForAServiceWhoseSocketIsHeldForIt) {
    mirror({"a"});
    service.kill();
    service.holdSocket();
    linesUpTo("reconnecting");
    const auto next = client.upsertItem("b", "a");
    service.start();
    EXPECT_THAT(linesUpTo("reconnected"), ElementsAre("reconnected"));
    EXPECT_EQ(position("a"), 0);
}

TEST_F(Reconnecting, FailsTheItemsWhoseFilesAreGoneButNotThoseThatWereGranted) {
    const auto granted = file("a");
    const auto path = (service.folder() / "a.wav").string();
    const auto token = client.grantFile(path);
    client.upsertAsset({.identifier = "a", .URL = granted.URL, .sandboxExtensionToken = token}).get();
    client.upsertItem("a", "a").get();
    mirror({"b", "c"});
    client.upsertQueuePlayer(player, {"a", "b", "c"}).get();
    std::filesystem::remove(path);
    std::filesystem::remove(service.folder() / "b.wav");
    service.kill();
    service.start();
    linesUpTo("reconnected");
    EXPECT_THAT(changesUpTo("b: failed to play to its end", client),
                ElementsAre(testing::StartsWith("b: failed: "), "b: failed to play to its end"));
    EXPECT_EQ(client.currentTime("b").get().error.code, 26);
    EXPECT_EQ(client.currentTime("a").get().outcome, Outcome::answered);
    EXPECT_THAT(nextItems(2), ElementsAre("now c", "now nothing"));
}

TEST_F(Reconnecting, DoesNotFightForItsPlaceAndTakesItWhenAskedTo) {
    mirror({"a"});
    client.setRate(player, 1).get();
    auto other = std::make_unique<Client>(service.options());
    linesUpTo("taken over");
    EXPECT_EQ(client.nextEvent(), std::nullopt);
    EXPECT_EQ(client.setRate(player, 0).get().outcome, Outcome::takenOver);
    EXPECT_TRUE(isServed(*other, service.song()));
    client.reconnect();
    EXPECT_THAT(linesUpTo("reconnected"), ElementsAre("reconnected"));
    EXPECT_THAT(changesUpTo("taken over", *other), ElementsAre("taken over"));
    // The service forgets everybody when one that was replaced leaves. Nobody else wants the place.
    other.reset();
    EXPECT_THAT(changesUpTo("reconnected", client), ElementsAre("reconnecting", "reconnected"));
    waitFor("a", position("a") + 0.1);

    auto third = std::make_unique<Client>(service.options());
    Client fourth(service.options());
    EXPECT_TRUE(isServed(fourth, service.song()));
    third.reset();
    EXPECT_THAT(changesUpTo("connection lost", fourth), ElementsAre("connection lost"));
}

TEST_F(Reconnecting, GivesUpAtItsLimitAndKeepsItAllForALaterTry) {
    // Long enough for a busy machine to put everything back.
    Client impatient({.socketPath = service.socketPath(), .reconnectLimit = 2s});
    impatient.upsertAsset(file("a")).get();
    impatient.upsertItem("a", "a").get();
    service.kill();
    EXPECT_THAT(changesUpTo("connection lost", impatient), ElementsAre("reconnecting", "connection lost"));
    EXPECT_EQ(impatient.currentTime("a").get().outcome, Outcome::connectionLost);
    EXPECT_EQ(impatient.nextEvent(), std::nullopt);
    EXPECT_THROW(impatient.reconnect(), std::system_error);
    service.start();
    impatient.reconnect();
    EXPECT_EQ(impatient.currentTime("a").get().outcome, Outcome::answered);
    EXPECT_THAT(changesUpTo("reconnected", impatient), ElementsAre("reconnected"));
}

} // namespace
} // namespace tarn
