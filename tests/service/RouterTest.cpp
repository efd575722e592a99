#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <barrier>
#include <thread>

#include "objects/AssetManager.h"
#include "objects/PlayerItemManager.h"
#include "queueplayer/QueuePlayerManager.h"
#include "service/AudioFilePlayerServer.h"
#include "tests/service/World.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"

namespace tarn {
namespace {

class Service final : public EventSink {
public:
    void sendData(const Data&) override {}
};

class RouterTest : public testing::Test {
protected:
    SimulatedPlatform platform_{1};
    std::shared_ptr<VLTorviAudioFilePlayerServer> router_ =
        std::make_shared<VLTorviAudioFilePlayerServer>(platform_.roles());
};

TEST_F(RouterTest, ManagersAreMadeOnceAndLinkedToThoseThatAreThere) {
    auto service = std::make_shared<Service>();
    router_->setAudioServer(service);
    auto assets = router_->assetManagerCreateIfNeeded();
    auto items = router_->playerItemManagerCreateIfNeeded();
    EXPECT_EQ(items->assetManager(), assets);
    auto players = router_->queuePlayerManagerCreateIfNeeded();
    EXPECT_EQ(players->assetManager(), assets);
    EXPECT_EQ(players->playerItemManager(), items);
    EXPECT_EQ(router_->playerItemManagerCreateIfNeeded(), items);
    EXPECT_EQ(players->audioServer(), service);

    auto other = std::make_shared<Service>();
    router_->setAudioServer(other);
    EXPECT_EQ(items->audioServer(), service);
    router_->setAppConnction(other);
    EXPECT_EQ(router_->audioServer(), other);
    EXPECT_EQ(assets->audioServer(), other);
    EXPECT_EQ(items->audioServer(), other);
    EXPECT_EQ(players->audioServer(), other);
}

TEST_F(RouterTest, AManagerIsLinkedToOneThatIsMadeLater) {
    auto players = router_->queuePlayerManagerCreateIfNeeded();
    EXPECT_EQ(players->playerItemManager(), nullptr);
    auto items = router_->playerItemManagerCreateIfNeeded();
    EXPECT_EQ(players->playerItemManager(), items);
    EXPECT_EQ(items->assetManager(), nullptr);
}

// The managers' slots are filled from two queues.
TEST(RouterRaceTest, ManagersMadeAtTheSameTimeAreOneOfAKindAndLinked) {
    constexpr int rounds = 2'000;
    SimulatedPlatform platform(1);
    std::shared_ptr<VLTorviAudioFilePlayerServer> router;
    std::barrier barrier(2);
    auto renew = [&] {
        for (int round = 0; round < rounds; ++round) {
            router = std::make_shared<VLTorviAudioFilePlayerServer>(platform.roles());
            barrier.arrive_and_wait();
            auto players = router->queuePlayerManagerCreateIfNeeded();
            auto assets = router->assetManagerCreateIfNeeded();
            barrier.arrive_and_wait();
            auto items = router->playerItemManagerCreateIfNeeded();
            EXPECT_EQ(router->queuePlayerManagerCreateIfNeeded(), players);
            EXPECT_EQ(players->playerItemManager(), items);
            EXPECT_EQ(players->assetManager(), assets);
            EXPECT_EQ(items->assetManager(), assets);
        }
    };
    std::jthread other([&] {
        for (int round = 0; round < rounds; ++round) {
            barrier.arrive_and_wait();
            auto items = router->playerItemManagerCreateIfNeeded();
            auto players = router->queuePlayerManagerCreateIfNeeded();
            EXPECT_NE(players, nullptr);
            EXPECT_NE(items, nullptr);
            barrier.arrive_and_wait();
        }
    });
    renew();
}

TEST_F(RouterTest, OnlyTheFirstPartOfAMessageIsServed) {
    const auto asset = commands::upsertAsset({.identifier = "a", .URL = "file:///none"});
    for (const auto& [part, server] : {std::pair(commands::appendItem("a", "a"), "QueuePlayerManager"),
                                       std::pair(commands::getCurrentTime("a"), "PlayerItemManager")}) {
        CapturedLog log;
        const auto message = std::make_shared<VLProtoAudioFilePlayerMessage>();
        for (const auto& each : {asset, commands::getCurrentTime("a"), part})
            message->mergeFrom(*each);
        router_->handleMessage(message, Reply());
        platform_.scheduler.runReady();
        EXPECT_THAT(log.errors(), testing::ElementsAre(testing::HasSubstr(server)));
    }
}

} // namespace
} // namespace tarn
