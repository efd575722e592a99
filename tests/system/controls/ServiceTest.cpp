#include <algorithm>
#include <fstream>
#include <iterator>

#include <gmock/gmock.h>

#include <tarn/Client.h>

#include "tests/support/AudioFixture.h"
#include "tests/system/controls/BusListener.h"
#include "tests/system/controls/FakeLoginManager.h"
#include "tests/system/controls/PrivateBus.h"
#include "tests/system/controls/RunningService.h"
#include "tests/system/sound/SoundServerProcess.h"

namespace tarn {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using testing::Contains;
using testing::Not;

constexpr char statusChanged[] = "Player: PlaybackStatus";
constexpr char trackChanged[] = "Player: PlaybackStatus Metadata";

/// The service as users have it: a sound server, a session bus, a client, and the desktop's tools.
class ServiceTest : public testing::Test {
protected:
    std::vector<std::string> serviceEnvironment() const {
        std::vector<std::string> environment = sound_.environment();
        environment.push_back(bus_.environment());
        environment.push_back("DBUS_SYSTEM_BUS_ADDRESS=" + bus_.address());
        return environment;
    }

    /// Two tracks of ten seconds in a queue player.
    void mirrorAlbum(const std::string& player = "album,org.example.MusicBox") {
        for (const std::string title : {"First", "Second"}) {
            const auto path = service_.folder() / (title + ".wav");
            writeWav(path, makeSweep(441'000, 44'100, 2));
            const auto asset = client_.upsertAsset({.identifier = title,
                                                    .URL = client::fileURL(path),
                                                    .title = title,
                                                    .albumTitle = "Songs",
                                                    .artist = "Someone"});
            ASSERT_TRUE(wait(asset));
            ASSERT_TRUE(wait(client_.upsertItem(title, title)));
        }
        ASSERT_TRUE(wait(client_.upsertQueuePlayer(player, {"First", "Second"})));
        ASSERT_TRUE(listener_.waitForPlayer());
    }

    template <class Future>
    static bool wait(const Future& future) {
        return future.wait_for(seconds(20)) == std::future_status::ready;
    }

    CommandResult playerctl(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {"playerctl", "--player=tarnd"});
        return runCommand(arguments, {bus_.environment()});
    }

    std::string status() const { return playerctl({"status"}).output; }

    /// Returns when it is heard.
    void play() {
        const Recorder recorder;
        ASSERT_EQ(listener_.call("Play"), "");
        ASSERT_EQ(listener_.next(), statusChanged);
        ASSERT_EQ(status(), "Playing\n");
        constexpr std::size_t tenth = 4410;
        for (int tenths = 0; tenths < 100 && !isHeard(recorder); ++tenths)
            recorder.waitFrames(tenth);
        ASSERT_TRUE(isHeard(recorder));
    }

    static bool isHeard(const Recorder& recorder) {
        const auto samples = recorder.samples();
        return std::any_of(samples.begin(), samples.end(), [](std::int16_t sample) { return sample != 0; });
    }

    /// A call, which lasts as long as the result. Returns when the sound server knows of it.
    std::unique_ptr<ChildProcess> call() const {
        const std::vector<std::string> command = {"pacat", "--verbose",    "--property=media.role=phone",
                                                  "--raw", "--device=out", "/dev/zero"};
        auto phone = std::make_unique<ChildProcess>(command, sound_.environment(),
                                                    ChildProcess::ErrorOutput::withOutput);
        EXPECT_TRUE(phone->readUntil("Stream successfully created"));
        phone->discardOutput();
        return phone;
    }

    SoundServerProcess sound_{{"module-role-cork"}};
    PrivateBus bus_;
    RunningService service_{serviceEnvironment(), TARND};
    client::Client client_{{.socketPath = service_.socketPath()}};
    BusListener listener_{bus_.address()};
};

TEST_F(ServiceTest, PlayerctlControlsAnAlbum) {
    mirrorAlbum();
    EXPECT_EQ(status(), "Paused\n");
    EXPECT_EQ(playerctl({"metadata", "--format", "{{artist}}|{{album}}|{{title}}|{{mpris:length}}"}).output,
              "Someone|Songs|First|10000000\n");

    EXPECT_EQ(playerctl({"play"}).status, 0);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Playing\n");
    EXPECT_EQ(playerctl({"play-pause"}).status, 0);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");

    EXPECT_EQ(playerctl({"next"}).status, 0);
    EXPECT_EQ(listener_.next(), trackChanged);
    EXPECT_EQ(playerctl({"metadata", "title"}).output, "Second\n");
    EXPECT_EQ(status(), "Paused\n");
    EXPECT_NE(playerctl({"previous"}).status, 0);

    EXPECT_NE(playerctl({"next"}).status, 0); // there is nothing more
    EXPECT_EQ(status(), "Stopped\n");
    ASSERT_TRUE(wait(client_.destroyQueuePlayer("album,org.example.MusicBox")));
    EXPECT_THAT(listener_.until("vanished"), Not(Contains(trackChanged)));
}

TEST_F(ServiceTest, EveryEventIsSignalledOnce) {
    mirrorAlbum();
    ASSERT_TRUE(wait(client_.setRate("album,org.example.MusicBox", 1)));
    EXPECT_EQ(listener_.next(), statusChanged);
    ASSERT_TRUE(wait(client_.setRate("album,org.example.MusicBox", 2)));
    EXPECT_EQ(listener_.next(), "Player: Rate MaximumRate");
    EXPECT_EQ(listener_.next(milliseconds(1000)), std::nullopt);
    ASSERT_TRUE(wait(client_.advanceToNextItem("album,org.example.MusicBox")));
    EXPECT_EQ(listener_.next(), trackChanged);
    ASSERT_TRUE(wait(client_.setCurrentTime("Second", 5))); // is published with the next change only
    ASSERT_TRUE(wait(client_.setRate("album,org.example.MusicBox", 0)));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Rate MaximumRate");
    const auto seeked = listener_.next();
    ASSERT_TRUE(seeked && seeked->starts_with("Seeked 5")) << seeked.value_or("none");
    ASSERT_TRUE(wait(client_.removeAllItems("album,org.example.MusicBox")));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata CanGoNext CanPlay CanPause");
    ASSERT_TRUE(wait(client_.destroyQueuePlayer("album,org.example.MusicBox")));
    EXPECT_EQ(listener_.next(), "vanished");
}

TEST_F(ServiceTest, TheContainingApplicationIsShown) {
    mirrorAlbum("album,org.example.MusicBox.watch");
    const auto identity =
        runCommand({"busctl", "--address=" + bus_.address(), "get-property", BusListener::playerName,
                    "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2", "Identity"});
    EXPECT_EQ(identity.output, "s \"Music Box\"\n");
}

TEST_F(ServiceTest, TheBusDiesAndComesBackWhileItPlays) {
    mirrorAlbum();
    play();
    for (int round = 0; round < 20; ++round) {
        bus_.kill();
        bus_.start();
        BusListener listener(bus_.address());
        ASSERT_TRUE(listener.waitForPlayer(seconds(2))) << round;
        EXPECT_EQ(listener.readAllProperties(), 20);
    }
    EXPECT_EQ(status(), "Playing\n");
    EXPECT_EQ(playerctl({"pause"}).status, 0);
    EXPECT_EQ(status(), "Paused\n");
}

TEST_F(ServiceTest, ACallInterruptsWhatPlays) {
    mirrorAlbum();
    play();
    for (int round = 0; round < 2; ++round) {
        auto phone = call();
        EXPECT_EQ(listener_.next(), statusChanged);
        EXPECT_EQ(status(), "Paused\n");
        phone.reset();
        EXPECT_EQ(listener_.next(), statusChanged);
        EXPECT_EQ(status(), "Playing\n");
    }
}

TEST_F(ServiceTest, WhatBeginsDuringACallWaitsForItsEnd) {
    mirrorAlbum();
    auto phone = call();
    EXPECT_EQ(listener_.call("Play"), "");
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    phone.reset();
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Playing\n");
}

TEST_F(ServiceTest, ACallLeavesWhatIsPausedAlone) {
    mirrorAlbum();
    play();
    ASSERT_EQ(listener_.call("Pause"), "");
    ASSERT_EQ(listener_.next(), statusChanged);
    call();
    EXPECT_EQ(listener_.next(milliseconds(1000)), std::nullopt);
    EXPECT_EQ(status(), "Paused\n");
}

TEST_F(ServiceTest, WhatIsPausedDuringACallStaysPaused) {
    mirrorAlbum();
    play();
    auto phone = call();
    ASSERT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(listener_.call("Pause"), "");
    phone.reset();
    EXPECT_EQ(listener_.next(milliseconds(1000)), std::nullopt);
    EXPECT_EQ(status(), "Paused\n");
}

TEST_F(ServiceTest, TheSystemSleepsAndPlaybackWorksAfterIt) {
    FakeLoginManager manager(bus_.address());
    mirrorAlbum();
    play();
    ASSERT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    manager.prepareForSleep(true);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    EXPECT_TRUE(manager.waitForLocks({}));
    EXPECT_TRUE(service_.waitForLog("Pausing before the system sleeps"));
    // What the sound server does to its device when the system goes to sleep and wakes up.
    sound_.control({"suspend-sink", "out", "1"});
    sound_.control({"suspend-sink", "out", "0"});
    manager.prepareForSleep(false);
    EXPECT_EQ(status(), "Paused\n");
    play();
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
}

TEST_F(ServiceTest, TheStreamTellsTheSoundServerWhatItIs) {
    mirrorAlbum();
    play();
    const std::string streams = sound_.control({"list", "sink-inputs"});
    for (const char* property :
         {R"(media.role = "music")", R"(application.name = "tarnd")", R"(application.id = "ostrel.tarnd")",
          R"(module-stream-restore.id = "sink-input-by-application-id:ostrel.tarnd")"})
        EXPECT_THAT(streams, testing::HasSubstr(property));
}

TEST_F(ServiceTest, HostileTagsOfAFileCostNothing) {
    const auto path = service_.folder() / "hostile.wav";
    writeWav(path, makeSweep(441'000, 44'100, 2));
    std::ifstream original(path, std::ios::binary);
    std::string content(std::istreambuf_iterator<char>(original), {});
    const auto chunk = [](const std::string& name, const std::string& body) {
        std::string size(4, '\0');
        for (std::size_t byte = 0; byte < 4; ++byte)
            size[byte] = static_cast<char>(body.size() >> (8 * byte));
        return name + size + body;
    };
    const std::string title = "\xff\xfe<3>\n\xe2\x80\xaetitle\xe2\x80\xac\x1b[2J\xed\xa0\x80";
    const std::string tags = chunk("INAM", title) + chunk("IART", std::string(1 << 20, '\n'));
    content.insert(12, chunk("LIST", "INFO" + tags));
    service_.folder().write("hostile.wav", content);

    ASSERT_TRUE(wait(client_.upsertAsset({.identifier = "hostile", .URL = client::fileURL(path)})));
    ASSERT_TRUE(wait(client_.upsertItem("hostile", "hostile")));
    ASSERT_TRUE(wait(client_.upsertQueuePlayer("hostile,org.example.MusicBox", {"hostile"})));
    ASSERT_TRUE(listener_.waitForPlayer());
    play();
    EXPECT_EQ(listener_.readAllProperties(), 20);
    const std::string shown = playerctl({"metadata", "title"}).output;
    EXPECT_THAT(shown, testing::HasSubstr("title"));
    EXPECT_EQ(std::count(shown.begin(), shown.end(), '\n'), 1);
    EXPECT_EQ(shown.find('\x1b'), std::string::npos);
    ASSERT_TRUE(wait(client_.removeAllItems("hostile,org.example.MusicBox")));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata CanGoNext CanPlay CanPause");
}

TEST_F(ServiceTest, TheDeviceThatVanishesPauses) {
    mirrorAlbum();
    play();
    sound_.control({"unload-module", "module-null-sink"});
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    EXPECT_TRUE(service_.waitForLog("the device that played is gone"));
}

} // namespace
} // namespace tarn
