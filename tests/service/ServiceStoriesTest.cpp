#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <mutex>
#include <string>

#include "proto/VelmoMessage.h"
#include "service/AudioFilePlayerServer.h"
#include "tests/service/World.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

using testing::AnyOf;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

/// Not for this service; never answered.
Data nothingButAPlist() {
    VLProtoVelmoMessage envelope;
    envelope.setPlist(std::make_shared<VLProtoVelmoPlist>());
    return envelope.serialize();
}

/// The stories of a connection, each in many interleavings on the scheduler and some on real threads. After
/// each, nothing of it is left.
template <class World>
class ServiceStory : public testing::Test {
protected:
    template <class Story>
    void inEveryWorld(const Story& story) {
        for (int seed = 0; seed < World::rounds && !this->HasFailure(); ++seed) {
            SCOPED_TRACE("seed " + std::to_string(seed));
            {
                World world(static_cast<std::uint64_t>(seed));
                story(world);
            }
            for (const auto& [kind, count] : LiveObjects::counts())
                ASSERT_EQ(count, 0) << kind;
        }
    }

    /// How the client's calls ended, in the order of the calls; a call that ended twice is two entries.
    static std::vector<std::string> outcomes(const SimulatedClient& client, std::uint64_t calls) {
        std::vector<std::string> outcomes;
        for (std::uint64_t call = 1; call <= calls; ++call) {
            auto ended = client.outcomes(call);
            outcomes.insert(outcomes.end(), ended.begin(), ended.end());
            if (ended.empty())
                outcomes.push_back("open");
        }
        return outcomes;
    }

    CapturedLog log_; // keeps what commands log off the screen

    struct State {
        bool isValid;
        bool hasConnection;
        bool hasRouter;
        bool operator==(const State&) const = default;
    };
    static constexpr State idle{false, false, false};

    static State stateOf(World& world) {
        auto& service = world.service();
        bool hasRouter = false;
        service.commandServiceQueue()->sync([&] { hasRouter = service.audioFilePlayerServer() != nullptr; });
        return {service._connectionIsValid(), service.clientConnection() != nullptr, hasRouter};
    }
};

using Worlds = testing::Types<SimulatedWorld, ThreadedWorld>;
TYPED_TEST_SUITE(ServiceStory, Worlds);

TYPED_TEST(ServiceStory, EveryCallEndsOnceAndInOrderPerManager) {
    this->inEveryWorld([this](auto& world) {
        SimulatedClient client(world.listeners());
        for (int round = 0; round < 2; ++round) {
            client.call(commands::encoded(commands::getCurrentTime("unknown")));
            client.call(commands::encoded(commands::appendItem("unknown", "unknown")));
            client.call(
                commands::encoded(commands::upsertAsset({.identifier = "asset", .URL = "file:///none"})));
            client.call(commands::encoded(commands::destroyAsset("asset")));
            client.call(nothingButAPlist());
            client.send(commands::encoded(commands::getCurrentTime("unknown")));
            world.linger();
        }
        world.settle();
        auto outcomes = this->outcomes(client, 10);
        ASSERT_EQ(outcomes.size(), 10u);
        for (std::ptrdiff_t i = 0; i < 10; i += 5)
            EXPECT_THAT(std::vector(outcomes.begin() + i, outcomes.begin() + i + 5),
                        ElementsAre("error 26", "error 26", "error 24", "released", "released"));
        std::map<bool, std::uint64_t> last; // by manager queue
        for (const auto& delivery : client.deliveries()) {
            if (delivery.call % 5 == 0)
                continue; // ended on the command queue
            auto& before = last[delivery.call % 5 == 1];
            EXPECT_LT(before, delivery.call);
            before = delivery.call;
        }
    });
}

TYPED_TEST(ServiceStory, ANewClientReplacesTheOldOneWhichIsLeftOpen) {
    this->inEveryWorld([this](auto& world) {
        SimulatedClient first(world.listeners());
        for (int i = 0; i < 4; ++i)
            first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.linger();
        SimulatedClient second(world.listeners());
        for (int i = 0; i < 4; ++i)
            second.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        // Nothing is lost, and nothing of the one reaches the other.
        EXPECT_THAT(this->outcomes(first, 5), Each(AnyOf("error 26", "error 25")));
        EXPECT_EQ(first.deliveries().size(), 5u);
        EXPECT_THAT(this->outcomes(second, 4), Each("error 26"));
        EXPECT_EQ(second.deliveries().size(), 4u);
        EXPECT_EQ(first.outcome(5), "error 26"); // on the second client's router
        EXPECT_EQ(world.service().clientConnection().get(), &second.connection());
    });
}

TYPED_TEST(ServiceStory, CommandsThatWaitWhenTheirClientIsReplacedAreCancelled) {
    this->inEveryWorld([this](auto& world) {
        SimulatedClient first(world.listeners());
        first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        auto gate = world.clock().makeSignal();
        world.service().commandServiceQueue()->async(
            [gate] { EXPECT_TRUE(gate->wait(std::chrono::seconds(60))); });
        for (int i = 0; i < 3; ++i)
            first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settleIntake();
        SimulatedClient second(world.listeners());
        second.call(commands::encoded(commands::getCurrentTime("unknown")));
        while (world.service()._connectionIsValid())
            world.progress();
        gate->signal();
        world.settle();
        EXPECT_THAT(this->outcomes(first, 4), ElementsAre("error 26", "error 25", "error 25", "error 25"));
        EXPECT_EQ(second.outcome(1), "error 26");
    });
}

TYPED_TEST(ServiceStory, ALateAnswerGoesToTheConnectionThatItsCallCameFrom) {
    this->inEveryWorld([this](auto& world) {
        auto& service = world.service();
        SimulatedClient first(world.listeners());
        first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        std::shared_ptr<SerialQueue> items;
        service.commandServiceQueue()->sync(
            [&] { items = service.audioFilePlayerServer()->playerItemManagerQueue(); });
        auto gate = world.clock().makeSignal();
        items->async([gate] { EXPECT_TRUE(gate->wait(std::chrono::seconds(60))); });
        first.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settleIntake();
        service.commandServiceQueue()->sync([] {});
        SimulatedClient second(world.listeners());
        second.call(commands::encoded(commands::getCurrentTime("unknown")));
        while (second.outcome(1).empty())
            world.progress(); // the replacement does not wait for the manager
        EXPECT_EQ(first.outcome(2), "");
        gate->signal();
        items->sync([] {});
        EXPECT_THAT(this->outcomes(first, 2), ElementsAre("error 26", "error 26"));
        EXPECT_THAT(second.transcript(), ElementsAre("1: error 26"));
    });
}

TYPED_TEST(ServiceStory, AClientThatIsBackAtOnceIsServed) {
    this->inEveryWorld([](auto& world) {
        for (int round = 0; round < 3; ++round) {
            SimulatedClient ghost(world.listeners());
            ghost.call(commands::encoded(commands::getCurrentTime("unknown")));
            world.linger();
            ghost.hangUp();
            SimulatedClient back(world.listeners());
            back.call(commands::encoded(commands::getCurrentTime("unknown")));
            world.settle();
            EXPECT_EQ(back.outcome(1), "error 26");
        }
    });
}

TYPED_TEST(ServiceStory, ALossAtAnyStepLeavesNothingBehindAndTheNextClientIsServed) {
    this->inEveryWorld([this](auto& world) {
        {
            SimulatedClient client(world.listeners());
            auto loss = world.random(2) == 0 ? SimulatedClient::Loss::invalidated
                                             : SimulatedClient::Loss::interrupted;
            if (auto step = static_cast<int>(world.random(6)); step > 0)
                client.connection().loseAtStep(step, loss);
            for (int i = 0; i < 4; ++i)
                client.call(commands::encoded(commands::getCurrentTime("unknown")));
            world.linger();
            world.nowPlaying().setParentApplication(NowPlayingService::Origin::local, "application");
            client.connection().lose(loss);
            world.settle();
            EXPECT_EQ(this->stateOf(world), this->idle);
        }
        SimulatedClient next(world.listeners());
        next.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        EXPECT_EQ(next.outcome(1), "error 26");
    });
}

TYPED_TEST(ServiceStory, TheLossOfAReplacedConnectionTearsDownTheCurrentOne) {
    this->inEveryWorld([this](auto& world) {
        SimulatedClient first(world.listeners());
        SimulatedClient second(world.listeners());
        second.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        world.nowPlaying().setParentApplication(NowPlayingService::Origin::local, "application");
        first.breakOff();
        world.settle();
        EXPECT_EQ(this->stateOf(world), this->idle);
        EXPECT_EQ(world.nowPlaying().parentApplication(), std::nullopt);
        second.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        EXPECT_THAT(this->outcomes(second, 2), ElementsAre("error 26", "error 25"));
    });
}

TYPED_TEST(ServiceStory, DataThatIsNoEnvelopeCostsOneLineAndIsLetGo) {
    this->inEveryWorld([this](auto& world) {
        CapturedLog log;
        SimulatedClient client(world.listeners());
        client.call(Data{0x12, 0x05, 0x00});
        client.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        EXPECT_THAT(this->outcomes(client, 2), ElementsAre("released", "error 26"));
        auto line = testing::MatchesRegex(
            "-\\[VLLongFormAudioServer receiveData:callback:\\]:97: failed to initialize protoMessage, "
            "data=0x[0-9a-f]+, len=3");
        auto errors = log.errors();
        EXPECT_EQ(std::count_if(errors.begin(), errors.end(),
                                [&](const auto& text) { return testing::Matches(line)(text); }),
                  1);
    });
}

TYPED_TEST(ServiceStory, EventsGoToTheClientOfTheMomentInOrderOrNowhere) {
    this->inEveryWorld([this](auto& world) {
        world.service().sendData({0});
        auto sender = world.createQueue("sender");
        SimulatedClient first(world.listeners());
        std::uint8_t number = 0;
        auto sendSome = [&] {
            for (int i = 0; i < 10; ++i)
                sender->async([&, data = Data{++number}] { world.service().sendData(data); });
        };
        sendSome();
        world.linger();
        SimulatedClient second(world.listeners());
        sendSome();
        world.linger();
        second.hangUp();
        sendSome();
        sender->sync([] {});
        world.settle();
        std::uint8_t last = 0;
        for (const auto* client : {&first, &second})
            for (const auto& delivery : client->deliveries()) {
                ASSERT_TRUE(delivery.data.has_value());
                EXPECT_LT(last, delivery.data->front());
                last = delivery.data->front();
            }
        world.service().sendData({++number});
        EXPECT_EQ(this->stateOf(world), this->idle);
    });
}

/// Takes no work, and throws what it was given instead.
template <class Exception>
class FullQueue final : public SerialQueue {
public:
    explicit FullQueue(Exception exception) : exception_(std::move(exception)) {}

    void async(Work) override { throw exception_; }
    void sync(const std::function<void()>& work) override { work(); }
    bool isCurrent() const override { return false; }
    const std::string& label() const override { return label_; }

private:
    const Exception exception_;
    const std::string label_ = "full";
};

TYPED_TEST(ServiceStory, AnExceptionWhileRoutingAnswersItsCommandOnly) {
    this->inEveryWorld([this](auto& world) {
        SimulatedClient client(world.listeners());
        client.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        auto& service = world.service();
        service.commandServiceQueue()->sync([&] {
            service.audioFilePlayerServer()->setQueuePlayerManagerQueue(
                std::make_shared<FullQueue<std::length_error>>(std::length_error("the queue is full")));
        });
        client.call(commands::encoded(commands::appendItem("unknown", "unknown")));
        client.send(commands::encoded(commands::appendItem("unknown", "unknown")));
        client.call(commands::encoded(commands::getCurrentTime("unknown")));
        world.settle();
        EXPECT_THAT(this->outcomes(client, 3), ElementsAre("error 26", "error 24", "error 26"));
        for (const auto& delivery : client.deliveries()) {
            if (delivery.call != 2)
                continue;
            EXPECT_EQ(delivery.error->userInfo.at(localizedFailureReasonKey), "the queue is full");
        }
    });
}

// Half a change that goes on would be worse than a new start.
TEST(ServiceDeathTest, AnExceptionOfAnotherKindEndsTheProcess) {
    testing::GTEST_FLAG(death_test_style) = "threadsafe";
    EXPECT_DEATH(
        {
            SimulatedWorld world(0);
            SimulatedClient client(world.listeners());
            client.send(commands::encoded(commands::getCurrentTime("unknown")));
            world.settle();
            auto& service = world.service();
            service.commandServiceQueue()->sync([&] {
                service.audioFilePlayerServer()->setQueuePlayerManagerQueue(
                    std::make_shared<FullQueue<int>>(1));
            });
            client.send(commands::encoded(commands::appendItem("unknown", "unknown")));
            world.settle();
        },
        "");
}

TEST(ServiceDeathTest, ReplacingTheConnectionFromTheCommandQueueIsReported) {
    testing::GTEST_FLAG(death_test_style) = "threadsafe";
    SimulatedWorld world(0);
    auto& service = world.service();
    EXPECT_DEATH(service.commandServiceQueue()->sync(
                     [&] { service._replaceCurrentConnectionWithConnection(nullptr); }),
                 "isCurrent|audioCommands");
}

} // namespace
} // namespace tarn
