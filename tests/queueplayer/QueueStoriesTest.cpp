#include <gmock/gmock.h>

#include <algorithm>

#include "roles/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// What the queue player does with its queue, and what the client sees of it.
class QueueStoriesTest : public ClientStory {
protected:
    std::shared_ptr<MediaQueuePlayer> player() {
        return client->players->queuePlayerWithIdentifier("player");
    }
};

TEST_F(QueueStoriesTest, PushesStatusRateAndCurrentItemBeforeTheAnswer) {
    mirror({"a", "b"});
    EXPECT_EQ(tell(upsertPlayer("player", {"a", "b"})),
              "push queuePlayer.setStatus identifier=player status=1\n"
              "push queuePlayer.setRate identifier=player rate=0\n"
              "push queuePlayer.setCurrentItem containedIdentifier=a identifier=player\n"
              "upsertWithItems: identifier=a status=1\n");
}

TEST_F(QueueStoriesTest, TheWholeOfATypicalClient) {
    device.media.addFile("file:///music/one.flac", {.title = "One", .artist = "Band", .duration = 10s});
    std::string seen = tell(upsertAsset({.identifier = "asset", .URL = "file:///music/one.flac"}));
    seen += tell(upsertItem("item", "asset"));
    seen += tell(upsertPlayer("player,extension", {"item"}));
    seen += tell(setRate("player,extension", 1));
    seen += pass(4s);
    seen += tell(setCurrentTime("item", 8));
    seen += tell(getCurrentTime("item"));
    seen += pass(2s);
    seen += tell(destroyPlayer("player,extension"));
    seen += tell(destroyItem("item"));
    seen += tell(destroyAsset("asset"));
    EXPECT_EQ(seen, "upsertWithMetaData: artist=Band duration=10 identifier=asset title=One\n"
                    "push playerItem.setStatus identifier=item status=0\n"
                    "upsertWithAsset: status=0\n"
                    "push queuePlayer.setStatus identifier=player,extension status=1\n"
                    "push queuePlayer.setRate identifier=player,extension rate=0\n"
                    "push queuePlayer.setCurrentItem containedIdentifier=item identifier=player,extension\n"
                    "upsertWithItems: identifier=item status=1\n"
                    "push playerItem.setStatus identifier=item status=1\n"
                    "push queuePlayer.setRate identifier=player,extension rate=1\n"
                    "setRate: no answer\n"
                    "push playerItem.notifyTimeJumped identifier=item\n"
                    "setItemCurrentTime: no answer\n"
                    "getCurrentTime: currentTime=8\n"
                    "push playerItem.notifyDidPlayToEndTime identifier=item\n"
                    "push queuePlayer.setCurrentItem identifier=player,extension\n"
                    "push queuePlayer.setRate identifier=player,extension rate=0\n"
                    "destroy: no answer\n"
                    "destroy: no answer\n"
                    "destroy: no answer\n");
    EXPECT_THAT(errors(), IsEmpty());
}

/// Looks, at the answer, whether the object can be found: its client may ask for it at once.
class FoundAtAnswer final : public Reply::Call {
public:
    FoundAtAnswer(MirroredClient& client, std::vector<bool>& found) : client_(client), found_(found) {}
    void answer(std::optional<Data>, const std::optional<Error>&) override {
        const auto& [assets, items, players] = std::tie(client_.assets, client_.items, client_.players);
        found_ = {assets->assetWithIdentifier("x") != nullptr,
                  items->playerItemWithIdentifier("x") != nullptr,
                  players->queuePlayerWithIdentifier("x") != nullptr};
    }

private:
    MirroredClient& client_;
    std::vector<bool>& found_;
};

TEST_F(QueueStoriesTest, WhatIsMadeIsThereWhenTheClientHearsOfIt) {
    std::vector<bool> found;
    std::vector<bool> expected(3);
    auto made = expected.begin();
    device.media.addFile("file:///x", {.duration = 1s});
    for (const auto& command : {upsertAsset({.identifier = "x", .URL = "file:///x"}), upsertItem("x", "x"),
                                upsertPlayer("x", {"x"})}) {
        *made++ = true;
        client->send(command, Reply(std::make_shared<FoundAtAnswer>(*client, found)));
        now();
        EXPECT_EQ(found, expected);
    }
}

TEST_F(QueueStoriesTest, AnAppendedItemIsPlayedLast) {
    mirror({"a", "b", "c"});
    tell(upsertPlayer("player", {"a", "b"}));
    tell(appendItem("player", "c"));
    for (const char* next : {"b", "c"})
        EXPECT_THAT(tell(advanceToNextItem("player")), HasSubstr(std::string("containedIdentifier=") + next));
}

TEST_F(QueueStoriesTest, APlayerKeepsTheManagersThatItWasMadeWith) {
    mirror({"a", "b"});
    auto items = client->players->playerItemManager();
    client->players->setPlayerItemManager(nullptr);
    client->players->setAssetManager(nullptr);
    EXPECT_EQ(tell(upsertPlayer("without", {})), "push queuePlayer.setStatus identifier=without status=1\n"
                                                 "push queuePlayer.setRate identifier=without rate=0\n"
                                                 "push queuePlayer.setCurrentItem identifier=without\n"
                                                 "upsertWithItems: status=1\n");
    EXPECT_EQ(tell(advanceToNextItem("player")),
              "push queuePlayer.setCurrentItem containedIdentifier=b identifier=player\n"
              "advanceToNextItem: no answer\n");
    client->players->setPlayerItemManager(items);
    EXPECT_EQ(tell(appendItem("without", "a")), "push queuePlayer.setCurrentItem identifier=without\n"
                                                "appendItem: no answer\n");
}

TEST_F(QueueStoriesTest, SetsTheSessionUpForEveryPlayerAndGoesOnWhenThatFails) {
    mirror({"a"});
    tell(upsertPlayer("other", {}));
    using Session = AudioSession;
    const SimulatedAudioSession::CategorySetting longForm{
        Session::Category::playback, Session::Mode::standard, Session::RouteSharingPolicy::longForm, 0};
    EXPECT_THAT(device.audioSession.categorySettings(), ElementsAre(longForm, longForm));
    device.audioSession.setCategoryError(Error{"test", 7, {}});
    EXPECT_THAT(tell(upsertPlayer("player", {"a"})), HasSubstr("upsertWithItems: identifier=a status=1\n"));
    EXPECT_THAT(errors(), ElementsAre("Could not set audio session category due to error: (test, code 7)."));
}

TEST_F(QueueStoriesTest, AnUnknownItemMakesAndReplacesNothing) {
    mirror({"a"});
    auto before = player();
    EXPECT_EQ(tell(upsertPlayer("player", {"a", "x", "y"})), "upsertWithItems: error 26\n");
    EXPECT_EQ(player(), before);
    client->players->setPlayerItemManager(nullptr);
    EXPECT_EQ(tell(upsertPlayer("other", {"a"})), "upsertWithItems: error 26\n");
    EXPECT_THAT(errors(), ElementsAre("Could not find MediaItem with id x when handling `upsertWithItems` "
                                      "command. Ignoring command.",
                                      "Could not find MediaItem with id a when handling `upsertWithItems` "
                                      "command. Ignoring command."));
}

TEST_F(QueueStoriesTest, PlaysTheQueueToItsEnd) {
    mirror({"a", "b"});
    EXPECT_EQ(tell(setRate("player", 1)), "push queuePlayer.setRate identifier=player rate=1\n"
                                          "setRate: no answer\n");
    EXPECT_EQ(pass(10s), "push playerItem.notifyDidPlayToEndTime identifier=a\n"
                         "push queuePlayer.setCurrentItem containedIdentifier=b identifier=player\n");
    EXPECT_EQ(tell(getCurrentTime("b")), "getCurrentTime: currentTime=0\n");
    EXPECT_EQ(pass(10s), "push playerItem.notifyDidPlayToEndTime identifier=b\n"
                         "push queuePlayer.setCurrentItem identifier=player\n"
                         "push queuePlayer.setRate identifier=player rate=0\n");
}

TEST_F(QueueStoriesTest, EditsTheQueueWhileItPlays) {
    mirror({"a", "b", "c"});
    tell(upsertPlayer("player", {"a"}));
    tell(setRate("player", 1));
    EXPECT_EQ(tell(appendItem("player", "b")), "appendItem: no answer\n");
    EXPECT_EQ(tell(replaceCurrentItem("player", "c")),
              "push queuePlayer.setCurrentItem containedIdentifier=c identifier=player\n"
              "replaceCurrentItem: no answer\n"
              "push playerItem.setStatus identifier=c status=1\n");
    EXPECT_EQ(tell(advanceToNextItem("player")),
              "push queuePlayer.setCurrentItem containedIdentifier=b identifier=player\n"
              "advanceToNextItem: no answer\n");
    EXPECT_EQ(tell(appendItem("player", "a")), "appendItem: no answer\n");
    EXPECT_EQ(tell(removeItem("player", "b")),
              "push queuePlayer.setCurrentItem containedIdentifier=a identifier=player\n"
              "removeItem: no answer\n");
    EXPECT_EQ(tell(removeAllItems("player")), "push queuePlayer.setCurrentItem identifier=player\n"
                                              "removeAllItems: no answer\n");
}

TEST_F(QueueStoriesTest, ReplacingThePlayerWhileItPlaysEndsItsSoundAndItsReports) {
    mirror({"a", "b"});
    tell(setRate("player", 1));
    std::weak_ptr<MediaQueuePlayer> before = player();
    pass(4s);
    EXPECT_EQ(tell(upsertPlayer("player", {"a", "b"})),
              "push queuePlayer.setStatus identifier=player status=1\n"
              "push queuePlayer.setRate identifier=player rate=0\n"
              "push queuePlayer.setCurrentItem containedIdentifier=a identifier=player\n"
              "upsertWithItems: identifier=a status=1\n");
    EXPECT_TRUE(before.expired());
    EXPECT_EQ(tell(getCurrentTime("a")), "getCurrentTime: currentTime=4\n");
    EXPECT_EQ(pass(60s), "");
}

TEST_F(QueueStoriesTest, DestroyingThePlayerWhileItPlaysSaysNothing) {
    mirror({"a"});
    tell(setRate("player", 1));
    EXPECT_EQ(tell(destroyPlayer("player")), "destroy: no answer\n");
    EXPECT_EQ(pass(60s), "");
}

TEST_F(QueueStoriesTest, ReplacingTheAssetLeavesWhatPlaysAlone) {
    mirror({"a"});
    tell(setRate("player", 1));
    song("a");
    EXPECT_EQ(pass(10s), "push playerItem.notifyDidPlayToEndTime identifier=a\n"
                         "push queuePlayer.setCurrentItem identifier=player\n"
                         "push queuePlayer.setRate identifier=player rate=0\n");
}

TEST_F(QueueStoriesTest, OnlyTheFirstCommandOfAMessageIsServedInTheOrderOfTheTable) {
    mirror({"a", "b"});
    // By what they do: an edit with an unknown item fails by name.
    struct Row {
        Command command;
        std::string effect;
        std::string error;
    };
    const std::vector<Row> table{
        {setRate("player", 2), "queuePlayer.setRate identifier=player rate=2", ""},
        {upsertPlayer("player", {"b"}), "identifier=b status=1", ""},
        {destroyPlayer("unknown"), "no answer", ""},
        {advanceToNextItem("player"), "containedIdentifier=b identifier=player", ""},
        {appendItem("player", "x"), "error 26", "`appendItem`"},
        {removeItem("player", "x"), "error 26", "`removeItem`"},
        {removeAllItems("player"), "queuePlayer.setCurrentItem identifier=player", ""},
        {replaceCurrentItem("player", "x"), "error 26", "`replaceCurrentItem`"},
    };
    for (std::size_t first = 0; first < table.size(); ++first) {
        tell(upsertPlayer("player", {"a", "b"}));
        const std::size_t errorsBefore = errors().size();
        auto command = std::make_shared<VLProtoAudioFilePlayerMessage>();
        for (std::size_t row = first; row < table.size(); ++row)
            command->mergeFrom(*table[row].command);
        const std::string seen = tell(command);
        EXPECT_THAT(seen, HasSubstr(table[first].effect)) << first;
        EXPECT_LE(std::count(seen.begin(), seen.end(), '\n'), first == 1 ? 4 : 2) << seen;
        std::vector<std::string> newErrors = errors();
        newErrors.erase(newErrors.begin(), newErrors.begin() + static_cast<std::ptrdiff_t>(errorsBefore));
        if (table[first].error.empty())
            EXPECT_THAT(newErrors, IsEmpty()) << first;
        else
            EXPECT_THAT(newErrors, ElementsAre(HasSubstr(table[first].error))) << first;
    }
}

TEST_F(QueueStoriesTest, AnEditWithAnUnknownItemIsAnsweredWhetherThePlayerIsKnownOrNot) {
    mirror({"a"});
    for (const char* name : {"player", "unknown"}) {
        EXPECT_EQ(tell(appendItem(name, "x")), "appendItem: error 26\n");
        EXPECT_EQ(tell(removeItem(name, "x")), "removeItem: error 26\n");
        EXPECT_EQ(tell(replaceCurrentItem(name, "x")), "replaceCurrentItem: error 26\n");
    }
    EXPECT_EQ(errors().size(), 6u);
}

TEST_F(QueueStoriesTest, WhoMakesTooManyObjectsIsRefusedUntilOthersGo) {
    mirror({"a"});
    const auto make = [&](int number) {
        const std::string name = std::to_string(number) + std::string(1'000'000, 'n');
        return tell(number % 2 == 0 ? upsertItem(name, "a") : upsertPlayer(name, {"a"}));
    };
    int made = 0;
    while (make(made).find("error 24") == std::string::npos)
        ASSERT_LT(++made, 20);
    EXPECT_EQ(made, 16) << "all kinds count together";
    EXPECT_EQ(
        tell(upsertAsset({.identifier = "b", .URL = "file:///a", .title = std::string(1'900'000, 't')})),
        "upsertWithMetaData: error 24 because: The program has made too many objects.\n");
    EXPECT_THAT(errors(), testing::Each(testing::HasSubstr("the client has made too many objects")));
    tell(destroyItem("0" + std::string(1'000'000, 'n')));
    EXPECT_EQ(make(0).find("error 24"), std::string::npos);
}

} // namespace
} // namespace tarn
