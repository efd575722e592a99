#include <tarn/Connection.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <stdexcept>
#include <system_error>
#include <thread>

#include "tests/ipc/TestServer.h"

namespace tarn {
namespace {

using client::Answer;
using client::Connection;
using client::Outcome;
using testing::Each;

Data bytes(std::string_view text) { return {text.begin(), text.end()}; }

/// Answers a call as its text asks for.
void answerAsAsked(ReceivedCall call) {
    if (call.data == bytes("answer"))
        call.reply.data(bytes("data"));
    else if (call.data == bytes("nothing"))
        call.reply.nothing();
    else if (call.data == bytes("fail"))
        call.reply.error({"domain", 26, {{localizedDescriptionKey, "Went wrong."}}});
}

/// Calls and waits for the end.
Answer ask(Connection& connection, std::string_view text) {
    std::promise<Answer> promise;
    connection.call(bytes(text), [&](Answer answer) { promise.set_value(std::move(answer)); });
    return promise.get_future().get();
}

TEST(AConnection, EndsEachCallInItsOwnWay) {
    const TestServer server(answerAsAsked);
    Connection connection({});
    EXPECT_EQ(ask(connection, "answer").outcome, Outcome::answered);
    EXPECT_EQ(ask(connection, "answer").data, bytes("data"));
    EXPECT_EQ(ask(connection, "nothing").outcome, Outcome::answered);
    EXPECT_EQ(ask(connection, "nothing").data, std::nullopt);
    EXPECT_EQ(ask(connection, "drop").outcome, Outcome::released);
    const auto failed = ask(connection, "fail");
    EXPECT_EQ(failed.outcome, Outcome::failed);
    EXPECT_EQ(failed.error.code, 26);
    EXPECT_EQ(failed.error.summary(), "Went wrong.");
    const client::Error untold{"domain", 4, {{"LocalizedDescription", "VLErrorMessage"}}};
    EXPECT_EQ(untold.summary(), "domain 4") << "no key of a text that is missing";
    EXPECT_TRUE(connection.send(bytes("answer")));
}

TEST(AConnection, EndsEveryPendingCallOnceWhenItIsLost) {
    constexpr std::size_t calls = 500;
    auto server = std::make_unique<TestServer>();
    std::promise<void> lost;
    Connection connection({nullptr, [&] { lost.set_value(); }});
    std::vector<int> ends(calls);
    for (auto& count : ends)
        connection.call(bytes("never"), [&count](const Answer& answer) {
            EXPECT_EQ(answer.outcome, Outcome::connectionLost);
            ++count;
        });
    server.reset();
    lost.get_future().get();
    EXPECT_THAT(ends, Each(1));
    EXPECT_FALSE(connection.isConnected());
    EXPECT_EQ(ask(connection, "answer").outcome, Outcome::connectionLost);
    EXPECT_FALSE(connection.send(bytes("answer")));
    EXPECT_THROW(connection.reconnect(), std::system_error);

    const TestServer next(answerAsAsked);
    Connection other({});
    EXPECT_EQ(ask(other, "answer").outcome, Outcome::answered);
}

TEST(AConnection, MayBeMadeAnewByManyThreadsWhileOthersCall) {
    constexpr int rounds = 50;
    const TestServer server(answerAsAsked);
    Connection connection({});
    std::atomic<int> ended = 0;
    {
        std::vector<std::jthread> threads;
        for (int i = 0; i < 2; ++i) {
            threads.emplace_back([&] {
                for (int k = 0; k < rounds; ++k)
                    connection.reconnect();
            });
            threads.emplace_back([&] {
                for (int k = 0; k < rounds; ++k) {
                    ask(connection, "answer");
                    ++ended;
                }
            });
        }
    }
    EXPECT_EQ(ended, 2 * rounds);
    EXPECT_EQ(ask(connection, "answer").outcome, Outcome::answered);
    connection.disconnect();
    EXPECT_FALSE(connection.isConnected());
    EXPECT_EQ(ask(connection, "answer").outcome, Outcome::connectionLost);
}

TEST(AConnection, TellsEventsAndAnswersInTheServicesOrder) {
    constexpr int calls = 300;
    FakeService* service = nullptr;
    TestServer server([&](ReceivedCall call) {
        service->connection()->remoteObjectProxy().receiveData(call.data);
        call.reply.data(call.data);
    });
    service = &server.service;
    std::vector<std::string> told;
    std::promise<void> done;
    Connection connection(
        {[&](const Data& event) { told.push_back("event " + std::string(event.begin(), event.end())); },
         nullptr});
    for (int i = 0; i < calls; ++i)
        connection.call(bytes(std::to_string(i)), [&, i](const Answer& answer) {
            told.push_back("answer " + std::string(answer.data->begin(), answer.data->end()));
            if (i == calls - 1)
                done.set_value();
        });
    done.get_future().get();
    ASSERT_EQ(told.size(), 2U * calls);
    for (int i = 0; i < calls; ++i) {
        EXPECT_EQ(told[static_cast<std::size_t>(2 * i)], "event " + std::to_string(i));
        EXPECT_EQ(told[static_cast<std::size_t>(2 * i + 1)], "answer " + std::to_string(i));
    }
}

TEST(AConnection, SaysWhyItCannotBeMadeOrUsed) {
    const TemporaryFolder folder;
    EXPECT_THROW(Connection({}, (folder / "nobody").string()), std::system_error);
    const TestServer server(answerAsAsked);
    Connection connection({});
    EXPECT_THROW(connection.send(Data(1'048'577)), std::length_error);
    EXPECT_THROW(connection.call(Data(1'048'577), [](const Answer&) { FAIL(); }), std::length_error);
    EXPECT_EQ(ask(connection, "answer").outcome, Outcome::answered);
}

} // namespace
} // namespace tarn
