#include "tests/system/controls/ControlsTest.h"

namespace tarn {
namespace {

using testing::HasSubstr;
using testing::MatchesRegex;
using testing::StartsWith;

class PropertiesTest : public ControlsTest {
protected:
    /// The property's type and value, as {"type":"s","data":"..."}.
    std::string property(const std::string& interface, const std::string& name) const {
        return runCommand({"busctl", "--address=" + bus_.address(), "--json=short", "get-property",
                           BusListener::playerName, "/org/mpris/MediaPlayer2",
                           "org.mpris.MediaPlayer2" + interface, name})
            .output;
    }

    std::string set(const std::string& name, const std::string& type, const std::string& value) const {
        return runCommand({"busctl", "--address=" + bus_.address(), "set-property", BusListener::playerName,
                           "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2.Player", name, type, value})
            .output;
    }

    void expectAll(const std::vector<std::array<std::string, 3>>& expected) const {
        for (const auto& [interface, name, value] : expected)
            EXPECT_EQ(property(interface, name), value + "\n") << name;
    }

    BusListener listener_{bus_.address()};
};

TEST_F(PropertiesTest, EveryPropertyHasItsTypeAndValue) {
    bringPlayer(track("First", 30, 0));
    ASSERT_TRUE(listener_.waitForPlayer());

    const std::string no = R"({"type":"b","data":false})";
    const std::string yes = R"({"type":"b","data":true})";
    const std::string one = R"({"type":"d","data":1.000000000000000000000e+00})";
    const std::string none = R"({"type":"as","data":[]})";
    expectAll(
        {{"", "CanQuit", no},
         {"", "CanRaise", no},
         {"", "HasTrackList", no},
         {"", "Identity", R"({"type":"s","data":"Music Box"})"},
         {"", "DesktopEntry", R"({"type":"s","data":"org.example.MusicBox"})"},
         {"", "SupportedUriSchemes", none},
         {"", "SupportedMimeTypes", none},
         {".Player", "PlaybackStatus", R"({"type":"s","data":"Paused"})"},
         {".Player", "Rate", one},
         {".Player", "MinimumRate", one},
         {".Player", "MaximumRate", one},
         {".Player", "Volume", one},
         {".Player", "Position", R"({"type":"x","data":30000000})"},
         {".Player", "CanGoNext", yes},
         {".Player", "CanGoPrevious", no},
         {".Player", "CanPlay", yes},
         {".Player", "CanPause", yes},
         {".Player", "CanSeek", no},
         {".Player", "CanControl", yes},
         {".Player", "Metadata",
          R"({"type":"a{sv}","data":{"mpris:trackid":{"type":"o","data":"/ostrel/tarnd/track/1"},)"
          R"("mpris:length":{"type":"x","data":180000000},"xesam:title":{"type":"s","data":"First"},)"
          R"("xesam:artist":{"type":"as","data":["Someone"]},"xesam:album":{"type":"s","data":"Songs"}}})"}});
    EXPECT_EQ(listener_.readAllProperties(), 20); // and no others
}

TEST_F(PropertiesTest, WithoutATrackThePlayerIsStopped) {
    bringPlayer({});
    ASSERT_TRUE(listener_.waitForPlayer());
    expectAll({{".Player", "PlaybackStatus", R"({"type":"s","data":"Stopped"})"},
               {".Player", "Metadata", R"({"type":"a{sv}","data":{}})"},
               {".Player", "CanPlay", R"({"type":"b","data":false})"},
               {".Player", "CanGoNext", R"({"type":"b","data":false})"},
               {".Player", "Position", R"({"type":"x","data":0})"}});
}

TEST_F(PropertiesTest, AnApplicationWithoutANameIsShownAsTheService) {
    for (const char* application : {"org.example.Unknown", "org.example.Blank"}) {
        publish(track("First", 0, 0), application);
        player_ = std::make_unique<FakePlayer>(controls_->remoteCommands());
        ASSERT_TRUE(listener_.waitForPlayer());
        expectAll({{"", "Identity", R"({"type":"s","data":"tarnd"})"},
                   {"", "DesktopEntry", R"({"type":"s","data":""})"}});
    }
}

TEST_F(PropertiesTest, ThePositionRunsWhileItPlays) {
    bringPlayer(track("First", 30, 4));
    ASSERT_TRUE(listener_.waitForPlayer());
    EXPECT_THAT(property(".Player", "Position"), MatchesRegex(R"(.*"x","data":3[0-9]{7}\}.*)"));
    const std::string four = "{\"type\":\"d\",\"data\":4.000000000000000000000e+00}\n";
    EXPECT_EQ(property(".Player", "Rate"), four);
    EXPECT_EQ(property(".Player", "MaximumRate"), four);
}

TEST_F(PropertiesTest, OnlyTheRateCanBeSetAndOnlyToWhatACommandCanDo) {
    bringPlayer(track("First", 30, 2));
    ASSERT_TRUE(listener_.waitForPlayer());
    EXPECT_EQ(set("Rate", "d", "1.5"), "");
    EXPECT_EQ(set("Rate", "d", "nan"), "");
    EXPECT_EQ(set("Rate", "d", "0"), "");
    EXPECT_EQ(set("Rate", "d", "1"), "");
    ASSERT_TRUE(player_->waitForCommands(2));
    EXPECT_THAT(player_->commands(), testing::ElementsAre("pause", "play"));
    EXPECT_THAT(set("Volume", "d", "0.5"), HasSubstr("not writable"));
    EXPECT_THAT(set("LoopStatus", "s", "Track"), StartsWith("Failed to set property"));
}

TEST_F(PropertiesTest, TheObjectDescribesItselfAndAnswersPings) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    const auto described = runCommand({"busctl", "--address=" + bus_.address(), "introspect",
                                       BusListener::playerName, "/org/mpris/MediaPlayer2"});
    EXPECT_EQ(described.status, 0);
    for (const char* member : {".Next", ".OpenUri", ".SetPosition", ".Seeked", ".Metadata"})
        EXPECT_THAT(described.output, HasSubstr(member));
    EXPECT_EQ(runCommand({"busctl", "--address=" + bus_.address(), "call", BusListener::playerName,
                          "/org/mpris/MediaPlayer2", "org.freedesktop.DBus.Peer", "Ping"})
                  .status,
              0);
}

TEST_F(PropertiesTest, HostileTextsAreShownCleanAndCostNothing) {
    bringPlayer(track("First", 0, 0));
    ASSERT_TRUE(listener_.waitForPlayer());
    for (const std::string& text :
         {std::string("nul\0inside", 10), std::string("\xff\xfe\x80"),
          std::string("\xed\xa0\x80\xf4\x90\x80\x80"), std::string("\xef\xbf\xbe\xef\xb7\x90"),
          std::string(1 << 20, '\n'), std::string("\xe2\x80\xaetxt.exe\xe2\x80\xac")}) {
        publish({.title = text,
                 .duration = 1e300,
                 .elapsedTime = -5.0,
                 .playbackRate = 0.0F,
                 .artist = text,
                 .albumTitle = text});
        EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
        EXPECT_EQ(listener_.readAllProperties(), 20);
    }
    publish({.title = "Last",
             .duration = {},
             .elapsedTime = {},
             .playbackRate = {},
             .artist = {},
             .albumTitle = {}},
            std::string("org\0\xff\n", 6));
    EXPECT_EQ(listener_.next(), "Root: Identity DesktopEntry");
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata");
}

} // namespace
} // namespace tarn
