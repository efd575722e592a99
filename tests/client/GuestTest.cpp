#include <tarn/Client.h>

#include <poll.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <string>

#include "ipc/SocketAddress.h"
#include "tests/system/transport/ServiceUnderTest.h"

// What the library does to the program that it is a part of.

namespace tarn {
namespace {

using namespace std::chrono_literals;
using client::Client;
using client::Outcome;

std::size_t numberOfThreads() {
    const std::filesystem::directory_iterator tasks("/proc/self/task");
    return static_cast<std::size_t>(std::distance(begin(tasks), end(tasks)));
}

TEST(AGuest, NeedsNoThreadInAProgramWithALoopOfItsOwn) {
    ServiceUnderTest service;
    const auto song = service.song();
    const auto threads = numberOfThreads();
    Client client(
        {.socketPath = service.socketPath(), .driver = client::Driver::program, .reconnectLimit = 20s});
    bool played = false;
    bool ended = false;
    client.upsertAsset({.identifier = "a", .URL = song}, [&](const auto& asset) {
        EXPECT_EQ(asset.value.duration, 1);
        client.upsertItem("a", "a", [&](const auto&) {
            client.upsertQueuePlayer("player", {"a"}, [&](const auto&) { client.setRate("player", 4); });
        });
    });
    while (!ended) { // as every main loop does
        pollfd ready{client.eventDescriptor(), POLLIN, 0};
        ASSERT_EQ(::poll(&ready, 1, 20'000), 1);
        for (const auto& event : client.drainEvents()) {
            played |= std::holds_alternative<client::ItemPlayedToEnd>(event);
            ended |= played && describe(event) == "player: rate 0"; // the last of what the end brings
        }
    }
    service.kill();
    EXPECT_EQ(describe(*client.nextEvent(20s)), "reconnecting");
    EXPECT_EQ(client.nextEvent(1ms), std::nullopt);
    auto position = client.currentTime("a");
    service.start();
    EXPECT_EQ(client.await(std::move(position)).outcome, Outcome::answered);
    EXPECT_EQ(describe(*client.nextEvent(20s)), "reconnected");
    EXPECT_EQ(numberOfThreads(), threads);
}

TEST(AGuest, BlocksAllSignalsOnItsThreadAndOnNoOtherOfTheProgram) {
    const ServiceUnderTest service;
    const Client client(service.options());
    int own = 0;
    for (const auto& task : std::filesystem::directory_iterator("/proc/self/task")) {
        std::ifstream file(task.path() / "status");
        const std::string status(std::istreambuf_iterator<char>(file), {});
        const bool isOurs = status.find("Name:\tlibtarn\n") != std::string::npos;
        const bool isMain = task.path().filename() == std::to_string(::getpid());
        own += isOurs ? 1 : 0;
        if (isOurs || isMain) { // A sanitizer has a thread too, and blocks its signals.
            EXPECT_EQ(status.find("SigBlk:\tfffffff") != std::string::npos, isOurs) << status;
        }
    }
    EXPECT_EQ(own, 1);
}

TEST(AGuest, LeavesAForkNothingOfItsConnection) {
    const ServiceUnderTest service;
    Client client(service.options());
    ASSERT_TRUE(isServed(client, service.song()));
    const pid_t child = ::fork();
    if (child == 0) {
        bool isDead = client.currentTime("item").get().outcome == Outcome::connectionLost;
        isDead = isDead && !client.connection().isConnected() && !client.nextEvent();
        for (const auto& file : std::filesystem::directory_iterator("/proc/self/fd"))
            isDead = isDead && !std::filesystem::read_symlink(file).string().starts_with("socket:");
        client.~Client();
        ::_exit(isDead ? 0 : 1);
    }
    int status = -1;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(client.currentTime("item").get().outcome, Outcome::answered);
}

TEST(AGuest, DropsWhatHandlersThrow) {
    const ServiceUnderTest service;
    int events = 0;
    Client client({.socketPath = service.socketPath(), .onEvent = [&](const client::Event&) {
                       ++events;
                       throw std::runtime_error("from a handler");
                   }});
    ASSERT_TRUE(isServed(client, service.song()));
    client.destroyAsset("none", [](const auto&) { throw std::runtime_error("from another"); });
    EXPECT_TRUE(isServed(client, service.song()));
    EXPECT_GE(events, 2);
}

TEST(AGuest, DoesNotTalkToAServiceOfSomebodyElse) {
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can become somebody else";
    constexpr uid_t somebodyElse = 65'534;
    const TemporaryFolder folder;
    const auto path = (folder / "socket").string();
    const FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    ASSERT_TRUE(SocketAddress(path).bind(socket.get()));
    ASSERT_EQ(::seteuid(somebodyElse), 0);
    EXPECT_EQ(::listen(socket.get(), 1), 0);
    ASSERT_EQ(::seteuid(0), 0);
    try {
        const Client client({.socketPath = path});
        FAIL();
    } catch (const std::system_error& problem) {
        EXPECT_EQ(problem.code().value(), EPERM);
    }
}

} // namespace
} // namespace tarn
