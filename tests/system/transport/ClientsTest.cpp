#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sys/wait.h>

#include <thread>
#include <variant>

#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using client::Client;
using client::Outcome;

TEST(Clients, EveryCommandSentAheadOfAReplacementEndsOnce) {
    constexpr int commands = 500;
    ServiceUnderTest service;
    Client first(service.options());
    std::vector<std::future<client::Completion>> ends;
    ends.reserve(commands);
    for (int i = 0; i < commands; ++i)
        ends.push_back(first.destroyAsset("none"));
    Client second(service.options());
    for (auto& end : ends) {
        const auto completion = end.get();
        EXPECT_TRUE(completion.outcome == Outcome::released || completion.outcome == Outcome::takenOver);
    }
    EXPECT_TRUE(isServed(second, service.song()));
}

TEST(Clients, ReplacingEachOtherLeaveNothingBehind) {
    constexpr int warmUp = 20; // what is made once, at the first need, stays
    constexpr int replacements = 200;
    ServiceUnderTest service;
    const auto song = service.song();
    Client client(service.options());
    std::size_t files = 0;
    std::size_t threads = 0;
    for (int i = 0; i < replacements; ++i) {
        ASSERT_TRUE(isServed(client, song));
        ASSERT_EQ(client.upsertQueuePlayer("player", {"item"}).get().outcome, Outcome::answered);
        client.reconnect();
        ASSERT_EQ(client.destroyAsset("none").get().outcome, Outcome::released);
        if (i == warmUp) {
            files = service.openFiles();
            threads = service.threads();
        }
    }
    // One of each may come and go in the background.
    EXPECT_LE(service.openFiles(), files + 2);
    EXPECT_LE(service.threads(), threads + 2);
}

TEST(Clients, ALostServiceEndsEveryCallAndServesThemWhenItIsBack) {
    ServiceUnderTest service;
    const auto song = service.song();
    Client client(service.options());
    ASSERT_TRUE(isServed(client, song));
    service.kill();
    while (const auto event = client.nextEvent())
        if (std::holds_alternative<client::ConnectionLost>(*event))
            break;
    EXPECT_EQ(client.currentTime("item").get().outcome, Outcome::connectionLost);
    EXPECT_THROW(client.reconnect(), std::system_error);
    service.start(); // over the socket file that the killed one left
    client.reconnect();
    EXPECT_TRUE(isServed(client, song));
}

TEST(Clients, ALentFileIsReadThroughItsTokenOnce) {
    ServiceUnderTest service;
    const auto song = service.song();
    const auto path = (service.folder() / "song.wav").string();
    Client client(service.options());
    const auto token = client.grantFile(path);
    // The service opens the path itself no more: only the lent file is left.
    std::filesystem::rename(path, path + ".moved");
    const auto opens = [&](const std::string& URL, const std::string& withToken) {
        return client.upsertAsset({.identifier = "a", .URL = URL, .sandboxExtensionToken = withToken})
                   .get()
                   .outcome == Outcome::answered;
    };
    EXPECT_FALSE(opens(song, "forged"));
    EXPECT_TRUE(opens(song, token));
    EXPECT_FALSE(opens(song, token)) << "it is spent";
    const auto another = client.grantFile(path + ".moved");
    EXPECT_FALSE(opens(song, another)) << "it is for another path";
}

} // namespace
} // namespace tarn
