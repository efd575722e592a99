#include "ipc/SocketListener.h"

#include <fcntl.h>
#include <sys/socket.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <future>
#include <mutex>
#include <thread>

#include "ipc/SocketAddress.h"
#include "ipc/TransportMessages.h"
#include "tests/ipc/TestServer.h"
#include "tests/support/TemporaryFolder.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

void echo(ReceivedCall call) { call.reply.data(call.data); }

TEST(SocketListener, AnswersEveryCallOnTheConnectionThatItCameOn) {
    TestServer server;
    auto first = server.connect();
    ASSERT_TRUE(first.send(FrameKind::call, 7, "first"));
    server.service.journalOf(2);
    auto second = server.connect();
    ASSERT_TRUE(second.send(FrameKind::call, 7, "second"));
    EXPECT_THAT(server.service.journalOf(4), ElementsAre("offered", "call first", "offered", "call second"));

    auto calls = server.service.takeKeptCalls();
    ASSERT_THAT(calls, SizeIs(2));
    calls[1].reply.error({"domain", -3, {{"key", "text"}}});
    auto copy = calls[0].reply;
    calls[0].reply.data(bytes("data"));
    copy.data(bytes("again"));
    calls.clear();

    const auto toFirst = first.receive();
    ASSERT_TRUE(toFirst);
    EXPECT_EQ(toFirst->kind, FrameKind::reply);
    EXPECT_EQ(toFirst->callId, 7U);
    EXPECT_EQ(decodeReply(toFirst->body)->data, bytes("data"));
    const auto toSecond = second.receive();
    ASSERT_TRUE(toSecond);
    EXPECT_EQ(decodeReply(toSecond->body)->data, std::nullopt);
    EXPECT_EQ(decodeReply(toSecond->body)->error, (Error{"domain", -3, {{"key", "text"}}}));

    ASSERT_TRUE(first.send(FrameKind::call, 8, "next"));
    server.service.journalOf(5);
    server.service.takeKeptCalls();
    const auto next = first.receive();
    ASSERT_TRUE(next);
    EXPECT_EQ(next->kind, FrameKind::released) << "the second answer to call 7 must not be there";
    EXPECT_EQ(next->callId, 8U);
}

void askForNewsAs(RawClient& client, std::uint64_t callId) {
    ASSERT_TRUE(client.send(FrameKind::call, callId, "\x78\x01"));
    if (callId != 0) {
        EXPECT_EQ(client.receive()->kind, FrameKind::reply);
    }
}

TEST(SocketListener, TellsThoseWhoAskedThatTheyAreNotTheCurrentClientAnyMore) {
    TestServer server(echo);
    auto silent = server.connect();
    auto first = server.connect();
    askForNewsAs(first, 1);
    auto second = std::make_optional(server.connect());
    EXPECT_EQ(first.receive()->kind, FrameKind::takenOver);
    auto third = server.connect();
    askForNewsAs(third, 0);
    server.service.journalOf(4);
    askForNewsAs(*second, 2);
    EXPECT_EQ(second->receive()->kind, FrameKind::takenOver) << "it had been, before it asked";
    second.reset();
    EXPECT_EQ(third.receive()->kind, FrameKind::forgotten);
    const auto fourth = server.connect();
    EXPECT_EQ(third.receive()->kind, FrameKind::takenOver);
    for (auto* client : {&silent, &first, &third}) { // no other news has come to them
        ASSERT_TRUE(client->send(FrameKind::call, 9));
        EXPECT_EQ(client->receive()->callId, 9U);
    }
    EXPECT_EQ(server.service.callCount(), 3U) << "the service hears nothing of it";
}

TEST(SocketListener, SendsEventsAndAnswersInTheOrderInWhichTheyWereMade) {
    constexpr int count = 1'000;
    FakeService* service = nullptr;
    TestServer server([&](ReceivedCall call) {
        service->connection()->remoteObjectProxy().receiveData(call.data);
        echo(std::move(call));
    });
    service = &server.service;
    auto client = server.connect();
    std::jthread sender([&] {
        for (int i = 1; i <= count; ++i)
            ASSERT_TRUE(client.send(FrameKind::call, static_cast<std::uint64_t>(i), std::to_string(i)));
    });
    for (int i = 1; i <= count; ++i) {
        const auto event = client.receive();
        const auto reply = client.receive();
        ASSERT_TRUE(event && reply);
        ASSERT_EQ(event->kind, FrameKind::event);
        ASSERT_EQ(event->body, bytes(std::to_string(i)));
        ASSERT_EQ(reply->kind, FrameKind::reply);
        ASSERT_EQ(reply->callId, static_cast<std::uint64_t>(i));
    }
}

// More than one read brings.
TEST(SocketListener, ReadsAllOfItWhenItSeesTheHangUpFirst) {
    constexpr std::size_t count = 10;
    std::promise<void> begun;
    std::promise<void> hungUp;
    TestServer server([&](ReceivedCall call) {
        if (call.data != bytes("first"))
            return;
        begun.set_value();
        hungUp.get_future().wait();
    });
    auto client = server.connect();
    ASSERT_TRUE(client.send(FrameKind::call, 0, "first"));
    begun.get_future().wait();
    for (std::size_t i = 0; i < count; ++i)
        ASSERT_TRUE(client.send(FrameKind::call, 0, std::string(8'000, 'c')));
    client.hangUp();
    hungUp.set_value();
    const auto journal = server.service.journalOf(1 + 1 + count + 1);
    EXPECT_THAT(journal, SizeIs(1 + 1 + count + 1));
    EXPECT_EQ(journal.back(), "invalidated");
}

TEST(SocketListener, SendsNothingThatIsTooLongForAFrame) {
    TestServer server([](ReceivedCall call) { call.reply.data(Data(FrameHeader::largestBody)); });
    auto client = server.connect();
    ASSERT_TRUE(client.send(FrameKind::call, 1));
    EXPECT_EQ(client.receive()->kind, FrameKind::released);
    auto& proxy = server.service.connection()->remoteObjectProxy();
    proxy.receiveData(Data(FrameHeader::largestBody + 1));
    proxy.receiveData(Data(FrameHeader::largestBody));
    EXPECT_EQ(client.receive()->body.size(), FrameHeader::largestBody);
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("an answer of"), HasSubstr("an event of")));
}

TEST(SocketListener, NoticesAHangUpBeforeTheClientThatComesBack) {
    constexpr std::size_t rounds = 500;
    TestServer server(echo);
    for (std::size_t i = 0; i < rounds; ++i)
        ASSERT_TRUE(server.connect().send(FrameKind::call, 0, ""));
    const auto journal = server.service.journalOf(3 * rounds);
    ASSERT_THAT(journal, SizeIs(3 * rounds));
    for (std::size_t i = 0; i < rounds; ++i)
        EXPECT_THAT(std::vector(&journal[3 * i], &journal[3 * i] + 3),
                    ElementsAre("offered", "call ", "invalidated"));
    EXPECT_EQ(LiveObjects::counts()["connection"], 1) << "the service still holds the last one";
}

TEST(SocketListener, EndsABrokenStreamWithOneLineAndServesTheOthers) {
    TestServer server(echo);
    auto good = server.connect();
    server.service.journalOf(1);
    auto bad = server.connect();
    ASSERT_TRUE(bad.send(FrameKind::call, 0, "before"));
    ASSERT_TRUE(bad.send(FrameKind::event, 0, "not for a client to send"));
    EXPECT_TRUE(bad.isCutOff());
    EXPECT_THAT(server.service.journalOf(4), ElementsAre("offered", "offered", "call before", "interrupted"));
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("the kind of frame is unknown")));
    ASSERT_TRUE(good.send(FrameKind::call, 1));
    EXPECT_TRUE(good.receive());
}

TEST(SocketListener, TakesAFileBehindMoreThanOneReadBrings) {
    std::promise<void> begun;
    std::promise<void> letGo;
    TestServer server([&](ReceivedCall call) {
        if (call.data != bytes("first"))
            return echo(std::move(call));
        begun.set_value();
        letGo.get_future().wait();
    });
    const TemporaryFolder folder;
    const auto path = folder.write("song", "music").string();
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    auto client = server.connect();
    ASSERT_TRUE(client.send(FrameKind::call, 0, "first"));
    begun.get_future().wait();
    ASSERT_TRUE(client.send(FrameKind::call, 0, std::string(100'000, 'c')));
    ASSERT_TRUE(client.grant("one", path, file.get()));
    letGo.set_value(); // all of it is there when it is read
    ASSERT_TRUE(client.send(FrameKind::call, 1) && client.receive());
    EXPECT_GE(server.tokens.consume("one"), 0);
}

TEST(SocketListener, RefusesTheSixtyFifthClientUntilOneGoes) {
    TestServer server(echo);
    std::vector<RawClient> clients;
    for (std::size_t i = 0; i < SocketListener::mostConnections; ++i)
        clients.push_back(server.connect());
    EXPECT_TRUE(server.connect().isCutOff());
    EXPECT_TRUE(server.connect().isCutOff());
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("there are too many")));
    clients.pop_back();
    auto next = server.connect();
    ASSERT_TRUE(next.send(FrameKind::call, 1));
    EXPECT_TRUE(next.receive());
}

TEST(SocketListener, CutsOffAClientThatDoesNotRead) {
    TestServer server(echo);
    auto slow = server.connect();
    server.service.journalOf(1);
    auto& proxy = server.service.connection()->remoteObjectProxy();
    const Data event(10'000, 'e');
    for (int i = 0; i < 1'000; ++i)
        proxy.receiveData(event);
    EXPECT_THAT(server.service.journalOf(2), ElementsAre("offered", "interrupted"));
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("does not read")));
    EXPECT_TRUE(slow.isCutOff());
}

TEST(SocketListener, DeliversWholeFramesToAClientThatReadsSlowly) {
    TestServer server(echo);
    auto client = server.connect();
    server.service.journalOf(1);
    auto& proxy = server.service.connection()->remoteObjectProxy();
    constexpr int count = 200; // 1 MB: more than the socket takes, less than may wait
    for (int i = 0; i < count; ++i)
        proxy.receiveData(Data(5'000, static_cast<std::uint8_t>(i)));
    for (int i = 0; i < count; ++i)
        ASSERT_EQ(client.receive()->body, Data(5'000, static_cast<std::uint8_t>(i)));
    EXPECT_THAT(server.log.errors(), IsEmpty());
}

/// Calls of one size, of which `most` may be unfinished. What came in one read is delivered together, so the
/// last read may pass the limit.
struct Flood {
    const char* name;
    std::size_t size;
    std::size_t count;
    std::size_t most;
    std::size_t inOneRead;
};

class FloodTest : public testing::TestWithParam<Flood> {};

TEST_P(FloodTest, IsNotReadWhileTooMuchOfItIsUnfinishedAndTheOthersAreServed) {
    const auto [name, size, count, most, inOneRead] = GetParam();
    std::mutex mutex;
    std::vector<ReceivedCall> kept;
    std::size_t seen = 0;
    TestServer server([&, size = size](ReceivedCall call) {
        if (call.data.size() != size)
            return echo(std::move(call));
        std::lock_guard lock(mutex);
        ++seen;
        kept.push_back(std::move(call));
    });
    auto other = server.connect();
    auto client = server.connect();
    std::jthread sender([&, size = size, count = count] {
        for (std::size_t i = 0; i < count; ++i)
            ASSERT_TRUE(client.send(FrameKind::call, 0, std::string(size, 'c')));
    });
    const auto takeTurns = [&] { // in each, the I/O thread could read from the client, too
        for (int i = 0; i < 300; ++i)
            ASSERT_TRUE(other.send(FrameKind::call, 1) && other.receive());
    };
    const auto isPaused = [&, most = most] {
        std::lock_guard lock(mutex);
        return seen >= most;
    };
    while (!isPaused())
        takeTurns();
    takeTurns();
    std::vector<ReceivedCall> finished;
    {
        std::lock_guard lock(mutex);
        EXPECT_LT(seen, most + inOneRead);
        finished.swap(kept);
    }
    finished.clear();
    const auto rest = [&] {
        std::lock_guard lock(mutex);
        finished = std::exchange(kept, {});
        return seen;
    };
    while (rest() < count) {
        finished.clear();
        std::this_thread::yield();
    }
}

INSTANTIATE_TEST_SUITE_P(, FloodTest,
                         testing::Values(Flood{"OfManyCalls", 100, 20'000,
                                               ConnectionSocket::mostUnfinishedCalls,
                                               65'536 / (FrameHeader::size + 100) + 1},
                                         Flood{"OfManyBytes", 100'000, 100,
                                               ConnectionSocket::mostUnfinishedBytes / 100'000 + 1, 1}),
                         [](const auto& flood) { return flood.param.name; });

TEST(SocketListener, ReadsLittleOfEachWhileAllTogetherLeaveMuchUnfinished) {
    constexpr std::size_t size = 100'000;
    std::mutex mutex;
    std::vector<ReceivedCall> kept;
    std::size_t seen = 0;
    TestServer server([&](ReceivedCall call) {
        if (call.data.size() != size)
            return echo(std::move(call));
        std::lock_guard lock(mutex);
        ++seen;
        kept.push_back(std::move(call));
    });
    auto other = server.connect();
    std::vector<RawClient> clients;
    for (int i = 0; i < 60; ++i) {
        clients.push_back(server.connect());
        for (int call = 0; call < 2; ++call) // as much as the socket holds
            ASSERT_TRUE(clients.back().send(FrameKind::call, 0, std::string(size, 'c')));
    }
    for (int i = 0; i < 300; ++i)
        ASSERT_TRUE(other.send(FrameKind::call, 1) && other.receive());
    const auto seenBefore = [&] {
        std::lock_guard lock(mutex);
        return seen;
    }();
    EXPECT_LE(seenBefore, ConnectionSocket::mostUnfinishedBytes / size / 2 + 1 + clients.size());
    for (std::size_t all = 0; all < 2 * clients.size();) {
        std::vector<ReceivedCall> finished;
        std::lock_guard lock(mutex);
        finished.swap(kept);
        all = seen;
    }
}

TEST(SocketListener, CutsOffWhoLeavesTooMuchUnfinishedWithTheOthers) {
    constexpr std::size_t clients = 16; // of which any 15 stay below the limit
    TestServer server(echo);
    Data whole;
    appendFrame(whole, FrameKind::call, 0, Data(FrameHeader::largestBody));
    const auto part = std::span(whole).first(whole.size() - 1);
    std::vector<RawClient> stalled;
    for (std::size_t i = 0; i < clients; ++i) {
        stalled.push_back(server.connect());
        stalled.back().sendBytes(part);
    }
    EXPECT_EQ(server.service.journalOf(clients + 1).back(), "interrupted");
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("left too much unfinished")));
    auto next = server.connect();
    ASSERT_TRUE(next.send(FrameKind::call, 1));
    EXPECT_TRUE(next.receive());
}

TEST(SocketListener, SeesAHangUpWhileItDoesNotRead) {
    TestServer server;
    auto client = server.connect();
    for (std::uint32_t i = 0; i < ConnectionSocket::mostUnfinishedCalls; ++i)
        ASSERT_TRUE(client.send(FrameKind::call, 1));
    server.service.journalOf(1 + ConnectionSocket::mostUnfinishedCalls);
    client.hangUp();
    const auto journal = server.service.journalOf(2 + ConnectionSocket::mostUnfinishedCalls);
    EXPECT_EQ(journal.back(), "invalidated");
}

TEST(SocketListener, RefusesAClientWhenNoDescriptorIsLeftAndGoesOnWhenOneIs) {
    TestServer server(echo);
    const FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    {
        std::vector<FileDescriptor> all;
        for (FileDescriptor each(::dup(STDERR_FILENO)); each; each = FileDescriptor(::dup(STDERR_FILENO)))
            all.push_back(std::move(each));
        ASSERT_TRUE(SocketAddress(server.path()).connect(socket.get()));
        char byte = 0;
        EXPECT_EQ(::recv(socket.get(), &byte, 1, 0), 0) << "refused, not left waiting";
    }
    EXPECT_THAT(server.log.errors(), ElementsAre(HasSubstr("no file descriptors are left")));
    auto next = server.connect();
    ASSERT_TRUE(next.send(FrameKind::call, 1));
    EXPECT_TRUE(next.receive());
}

// The I/O thread is busy when a client waits to be accepted and another hangs up.
TEST(SocketListener, NoticesAHangUpThatComesWhileAClientWaits) {
    std::promise<void> held[2];
    std::promise<void> letGo[2];
    int call = 0;
    TestServer server([&](ReceivedCall) {
        held[call].set_value();
        letGo[call].get_future().wait();
        ++call;
    });
    auto leaving = server.connect();
    auto busy = server.connect();
    ASSERT_TRUE(busy.send(FrameKind::call, 0, "one"));
    held[0].get_future().wait();
    ASSERT_TRUE(busy.send(FrameKind::call, 0, "two"));
    auto waiting = server.connect();
    letGo[0].set_value(); // from here on, the call and the client are known of
    held[1].get_future().wait();
    leaving.hangUp();
    letGo[1].set_value();
    EXPECT_THAT(server.service.journalOf(6),
                ElementsAre("offered", "offered", "call one", "call two", "invalidated", "offered"));
}

} // namespace
} // namespace tarn
