#include <gmock/gmock.h>

#include "roles/MediaQueuePlayer.h"
#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;

class NowPlayingTest : public ClientStory {
protected:
    NowPlayingTest() {
        device.applications.install("ostrel.watch.music", "ostrel.music");
        device.media.addFile("file:///tagged.flac",
                             {.title = "Song", .albumTitle = "Album", .artist = "Band", .duration = 200s});
        device.media.addFile("file:///plain.wav", {.duration = 3s});
        tell(upsertAsset({.identifier = "a", .URL = "file:///tagged.flac"}));
        tell(upsertItem("i", "a"));
    }

    /// What was published last, as it is always published: for the application of the moment, in place of
    /// what was there.
    NowPlayingInfo shown() {
        const auto& last = device.nowPlaying.publications().back();
        EXPECT_EQ(last.parentApplication, application());
        EXPECT_EQ(last.mergePolicy, 1);
        return last.info;
    }
    std::size_t publications() { return device.nowPlaying.publications().size(); }
    std::optional<std::string> application() { return device.nowPlaying.parentApplication(); }

    static NowPlayingInfo info(const std::string& title, double duration, double elapsed, float rate) {
        return {title, duration, elapsed, rate, std::nullopt, std::nullopt};
    }
};

TEST_F(NowPlayingTest, IsPublishedTwiceWhenAPlayerIsMadeAndAtEveryChangeOfRateOrItem) {
    tell(upsertPlayer("x,y,ostrel.watch.music", {"i"}));
    EXPECT_EQ(publications(), 2u);
    EXPECT_EQ(device.nowPlaying.publications().front().parentApplication, "ostrel.music");
    NowPlayingInfo expected = info("Song", 200, 0, 0);
    expected.artist = "Band";
    expected.albumTitle = "Album";
    EXPECT_EQ(shown(), expected);
    EXPECT_EQ(application(), "ostrel.music");

    tell(setRate("x,y,ostrel.watch.music", 1));
    pass(5s);
    tell(setCurrentTime("i", 100));
    tell(setRate("x,y,ostrel.watch.music", 0));
    expected.elapsedTime = 100;
    EXPECT_EQ(shown(), expected);
    EXPECT_EQ(publications(), 4u);

    tell(removeAllItems("x,y,ostrel.watch.music"));
    EXPECT_TRUE(shown().empty());
    EXPECT_EQ(publications(), 5u);
    tell(destroyPlayer("x,y,ostrel.watch.music"));
    EXPECT_EQ(publications(), 5u);
}

TEST_F(NowPlayingTest, IsPublishedBeforeTheClientIsToldOfTheChange) {
    tell(upsertPlayer("p", {"i"}));
    for (const auto& [report, command] : {std::pair("queuePlayer.setRate", setRate("p", 1)),
                                          std::pair("queuePlayer.setCurrentItem", removeAllItems("p"))}) {
        auto before = publications();
        std::size_t atReport = 0;
        client->transcript().whenPushed(report, [&] { atReport = publications(); });
        tell(command);
        EXPECT_EQ(atReport, before + 1) << report;
    }
}

TEST_F(NowPlayingTest, ShowsWhatHoldsWhenRateAndItemChangeAtOnce) {
    tell(upsertAsset({.identifier = "b", .URL = "file:///plain.wav"}));
    tell(upsertItem("j", "b"));
    tell(upsertPlayer("p", {"i", "j"}));
    auto before = publications();
    device.nowPlaying.duringNextPublication(
        [player = client->players->queuePlayerWithIdentifier("p")] { player->advanceToNextItem(); });
    tell(setRate("p", 1));
    EXPECT_EQ(shown(), info("plain.wav", 3, 0, 1));
    EXPECT_EQ(publications(), before + 2);
}

TEST_F(NowPlayingTest, HasOnlyWhatTheRecordHas) {
    tell(upsertAsset({.identifier = "a", .URL = "file:///plain.wav"}));
    tell(upsertItem("i", "a"));
    tell(upsertPlayer("p", {"i"}));
    EXPECT_EQ(shown(), info("plain.wav", 3, 0, 0));
    tell(upsertAsset({.identifier = "a", .title = "New", .artist = "Me"}));
    tell(setRate("p", 1));
    NowPlayingInfo expected = info("New", 3, 0, 1);
    expected.artist = "Me";
    EXPECT_EQ(shown(), expected);
}

TEST_F(NowPlayingTest, AnItemWithoutRecordOrTitleGoesByTheNameOfItsFile) {
    tell(upsertAsset({.identifier = "b", .URL = "file:///tagged.flac", .title = ""}));
    tell(upsertItem("j", "b"));
    tell(upsertPlayer("p", {"j", "i"}));
    EXPECT_EQ(shown().title, "tagged.flac");
    EXPECT_EQ(shown().artist, "Band");

    tell(destroyAsset("a"));
    tell(advanceToNextItem("p"));
    EXPECT_EQ(shown(), info("tagged.flac", 200, 0, 0));
}

TEST_F(NowPlayingTest, TheApplicationIsThatOfTheLastComponentOfTheIdentifier) {
    struct Case {
        const char* identifier;
        std::optional<std::string> application;
    };
    for (const Case& known :
         {Case{"ostrel.watch.music", "ostrel.music"}, Case{",ostrel.watch.music", "ostrel.music"},
          Case{"ostrel.watch.music,", std::nullopt}, Case{"", std::nullopt},
          Case{"ostrel.watch.music,unknown", std::nullopt}}) {
        tell(upsertPlayer(known.identifier, {"i"}));
        EXPECT_EQ(application(), known.application) << known.identifier;
        EXPECT_EQ(shown().title, "Song");
    }
}

} // namespace
} // namespace tarn
