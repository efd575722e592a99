#include <tarn/Client.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <future>
#include <system_error>

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "tests/ipc/TestServer.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using client::Client;
using client::Outcome;

TEST(AClient, TurnsCommandsIntoEnvelopesAndAnswersIntoValues) {
    std::shared_ptr<VLProtoVelmoMessage> asked;
    Data answer;
    const TestServer server([&](ReceivedCall call) {
        asked = VLProtoVelmoMessage::fromData(call.data);
        if (!answer.empty())
            call.reply.data(answer);
    });
    Client client;

    VLProtoAudioFilePlayerAssetUpdateMetaData info;
    info.setIdentifier("song");
    info.setDuration(12.5);
    info.setTitle("Title");
    answer = info.serialize();
    const auto asset =
        client.upsertAsset({.identifier = "song", .URL = "file:///song", .artist = "Someone"}).get();
    EXPECT_EQ(asset.outcome, Outcome::answered);
    EXPECT_EQ(asset.value.duration, 12.5);
    EXPECT_EQ(asset.value.title, "Title");
    EXPECT_EQ(asset.value.artist, std::nullopt);
    const auto upsert = asked->audioFilePlayerMessage()->asset()->upsertWithMetaData();
    EXPECT_EQ(upsert->uRL(), "file:///song");
    EXPECT_EQ(upsert->artist(), "Someone");
    EXPECT_FALSE(upsert->hasTitle());

    VLProtoAudioFilePlayerCurrentTime time;
    time.setCurrentTime(3.25);
    answer = time.serialize();
    EXPECT_EQ(client.currentTime("item").get().value, 3.25);

    VLProtoAudioFilePlayerStatus status;
    status.setStatus(1);
    status.setIdentifier("item");
    answer = status.serialize();
    const auto player = client.upsertQueuePlayer("player", {"item", "other"}).get();
    EXPECT_EQ(player.value.value, client::Status::Value::readyToPlay);
    EXPECT_EQ(player.value.identifier, "item");
    EXPECT_EQ(asked->audioFilePlayerMessage()->queuePlayer()->upsertWithItems()->playerItemIdentifiersCount(),
              2U);

    answer.clear();
    const auto rate = client.setRate("player", 2).get();
    EXPECT_EQ(rate.outcome, Outcome::released);
    EXPECT_TRUE(rate.succeeded());
    EXPECT_EQ(asked->audioFilePlayerMessage()->queuePlayer()->setRate()->rate(), 2.0F);
}

TEST(AClient, GrantsAFileUnderATokenForThePathOfItsURL) {
    TestServer server([](ReceivedCall) {});
    const TemporaryFolder folder;
    const auto path = folder.write("a song", "music").string();
    Client client;
    const auto token = client.grantFile(path);
    EXPECT_EQ(token.size(), 32U);
    EXPECT_NE(client.grantFile(path), token);
    ASSERT_EQ(client.destroyAsset("none").get().outcome, Outcome::released);
    EXPECT_GE(server.tokens.consume(token.c_str()), 0);
    EXPECT_TRUE(server.tokens.open(path));
    EXPECT_EQ(client::fileURL(path), "file://" + folder.path().string() + "/a%20song");
    EXPECT_EQ(client::fileURL("/a/../b/ü#?"), "file:///b/%C3%BC%23%3F");
    EXPECT_THROW(client.grantFile((folder / "nothing").string()), std::system_error);
}

} // namespace
} // namespace tarn
