#include <gmock/gmock.h>

#include <limits>

#include "roles/MediaItem.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using commands::destroyItem;
using commands::getCurrentTime;
using commands::setCurrentTime;
using commands::setRate;
using commands::upsertItem;
using testing::ElementsAre;
using testing::IsEmpty;

class PlayerItemStoriesTest : public ClientStory {};

TEST_F(PlayerItemStoriesTest, PushesTheFirstStatusBeforeTheAnswer) {
    song("a");
    EXPECT_EQ(tell(upsertItem("i", "a")), "push playerItem.setStatus identifier=i status=0\n"
                                          "upsertWithAsset: status=0\n");
}

TEST_F(PlayerItemStoriesTest, AnswersThatTheAssetIsUnknown) {
    EXPECT_EQ(tell(upsertItem("i", "a")), "upsertWithAsset: error 26\n");
    EXPECT_EQ(tell(upsertItem("i", std::nullopt)), "upsertWithAsset: error 26\n");
    client->items->setAssetManager(nullptr);
    EXPECT_EQ(tell(upsertItem("i", "a")), "upsertWithAsset: error 26\n");
    EXPECT_THAT(errors(), ElementsAre("Could not find MediaItem with id a when handling `upsertWithAsset` "
                                      "command. Ignoring command.",
                                      "Could not find MediaItem with id (null) when handling "
                                      "`upsertWithAsset` command. Ignoring command.",
                                      "Could not find MediaItem with id a when handling `upsertWithAsset` "
                                      "command. Ignoring command."));
}

TEST_F(PlayerItemStoriesTest, TellsAndMovesThePosition) {
    song("a");
    tell(upsertItem("i", "a"));
    EXPECT_EQ(tell(getCurrentTime("i")), "getCurrentTime: currentTime=0\n");
    EXPECT_EQ(tell(setCurrentTime("i", 2.51)), "push playerItem.notifyTimeJumped identifier=i\n"
                                               "setItemCurrentTime: no answer\n");
    // To the nearest sixtieth of a second.
    EXPECT_EQ(tell(getCurrentTime("i")), "getCurrentTime: currentTime=2.51666667\n");
    EXPECT_EQ(tell(setCurrentTime("i", std::numeric_limits<double>::quiet_NaN())),
              "setItemCurrentTime: no answer\n");
    EXPECT_EQ(errors().size(), 1u);
    EXPECT_EQ(tell(getCurrentTime("i")), "getCurrentTime: currentTime=2.51666667\n");

    EXPECT_EQ(tell(getCurrentTime("unknown")), "getCurrentTime: error 26\n");
    EXPECT_EQ(tell(setCurrentTime("unknown", 1)), "setItemCurrentTime: error 26\n");
}

TEST_F(PlayerItemStoriesTest, AReplacedItemReportsNoMoreThoughItPlaysOn) {
    mirror({"a"});
    tell(setRate("player", 1));
    auto playing = client->items->playerItemWithIdentifier("a");
    EXPECT_EQ(tell(upsertItem("a", "a")), "push playerItem.setStatus identifier=a status=0\n"
                                          "upsertWithAsset: status=0\n");
    EXPECT_NE(client->items->playerItemWithIdentifier("a"), playing);
    EXPECT_EQ(client->items->identifierForPlayerItem(playing.get()), std::nullopt);
    EXPECT_EQ(pass(10s), "push queuePlayer.setCurrentItem identifier=player\n"
                         "push queuePlayer.setRate identifier=player rate=0\n");
}

TEST_F(PlayerItemStoriesTest, OnlyTheFirstCommandOfAMessageIsServedInTheOrderOfTheTable) {
    mirror({"i"});
    tell(setCurrentTime("i", 2));
    // A line is named after the alphabetically first command of its message.
    auto query = getCurrentTime("i");
    query->mergeFrom(*setCurrentTime("i", 1));
    EXPECT_EQ(tell(query), "getCurrentTime: currentTime=2\n");
    auto destroy = destroyItem("i");
    destroy->mergeFrom(*query);
    EXPECT_EQ(tell(destroy), "destroy: no answer\n");
    EXPECT_EQ(client->items->playerItemWithIdentifier("i"), nullptr);
    auto upsert = upsertItem("i", "i");
    upsert->mergeFrom(*destroyItem("i"));
    EXPECT_EQ(tell(upsert), "push playerItem.setStatus identifier=i status=0\n"
                            "destroy: status=0\n");
    EXPECT_NE(client->items->playerItemWithIdentifier("i"), nullptr);
}

} // namespace
} // namespace tarn
