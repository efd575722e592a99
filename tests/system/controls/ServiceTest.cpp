#include <algorithm>
#include <cmath>
#include <thread>

#include <gmock/gmock.h>

#include <tarn/Client.h>

#include "tests/support/AudioFixture.h"
#include "tests/system/controls/FakeLoginManager.h"
#include "tests/system/controls/PrivateBus.h"
#include "tests/system/controls/SignalListener.h"
#include "tests/system/sound/SoundServerProcess.h"
#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using testing::HasSubstr;

constexpr char album[] = "album,org.example.MusicBox.watch";
constexpr char statusChanged[] = "Player: PlaybackStatus";

/// The service as users have it: a sound server, a session bus, a client, and the desktop's tools.
class ServiceTest : public testing::Test {
protected:
    std::vector<std::string> environment() const {
        data_.write("applications/org.example.MusicBox.desktop",
                    "[Desktop Entry]\nType=Application\nName=Music Box\nExec=true\n");
        std::vector<std::string> environment = sound_.environment();
        environment.insert(environment.end(),
                           {bus_.environment(), "DBUS_SYSTEM_BUS_ADDRESS=" + bus_.address(),
                            "XDG_DATA_HOME=" + data_.path().string()});
        return environment;
    }

    void SetUp() override {
        mirror(album, {"First", "Second"});
        ASSERT_EQ(listener_.next(), "appeared");
    }

    /// Tracks of ten seconds in a queue player.
    void mirror(const std::string& player, const std::vector<std::string>& titles) {
        for (const std::string& title : titles) {
            const auto path = service_.folder() / (title + ".wav");
            writeWav(path, makeSweep(441'000, 44'100, 2));
            wait(client_.upsertAsset({.identifier = title,
                                      .URL = client::fileURL(path),
                                      .title = title,
                                      .albumTitle = "Songs",
                                      .artist = "Someone"}));
            wait(client_.upsertItem(title, title));
        }
        wait(client_.upsertQueuePlayer(player, titles));
    }

    template <class Future>
    static void wait(const Future& future) {
        ASSERT_EQ(future.wait_for(seconds(20)), std::future_status::ready);
    }

    std::string status() const { return bus_.playerctl({"status"}).output; }

    double position() const { return std::stod(bus_.property("Position").substr(2)) / 1e6; }

    /// Returns when it is heard.
    void play() {
        const Recorder recorder;
        ASSERT_EQ(bus_.call({"Play"}), "");
        ASSERT_EQ(listener_.next(), statusChanged);
        ASSERT_EQ(status(), "Playing\n");
        constexpr std::size_t tenth = 4410;
        const auto isHeard = [&] {
            const auto samples = recorder.samples();
            return std::ranges::any_of(samples, [](std::int16_t sample) { return sample != 0; });
        };
        for (int tenths = 0; tenths < 100 && !isHeard(); ++tenths)
            recorder.waitFrames(tenth);
        ASSERT_TRUE(isHeard());
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

    TemporaryFolder data_;
    SoundServerProcess sound_{{"module-role-cork"}};
    PrivateBus bus_;
    SignalListener listener_{bus_};
    ServiceUnderTest service_{environment()};
    client::Client client_{service_.options()};
};

TEST_F(ServiceTest, PlayerctlControlsAnAlbum) {
    EXPECT_EQ(bus_.property("Identity", ""), "s \"Music Box\"");
    EXPECT_EQ(
        bus_.playerctl({"metadata", "--format", "{{artist}}|{{album}}|{{title}}|{{mpris:length}}"}).output,
        "Someone|Songs|First|10000000\n");
    for (const auto& [verb, after] : {std::pair("play", "Playing\n"), std::pair("play-pause", "Paused\n")}) {
        EXPECT_EQ(bus_.playerctl({verb}).status, 0);
        EXPECT_EQ(listener_.next(), statusChanged);
        EXPECT_EQ(status(), after);
    }
    EXPECT_EQ(bus_.playerctl({"position", "5"}).status, 0);
    EXPECT_EQ(listener_.next(), "Seeked 5000000");
    EXPECT_EQ(bus_.playerctl({"next"}).status, 0);
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata CanGoNext");
    EXPECT_EQ(bus_.playerctl({"metadata", "title"}).output, "Second\n");
    EXPECT_EQ(status(), "Paused\n");
    for (const char* verb : {"next", "previous"})
        EXPECT_NE(bus_.playerctl({verb}).status, 0) << verb;
    EXPECT_EQ(bus_.playerctl({"metadata", "title"}).output, "Second\n");
    wait(client_.destroyQueuePlayer(album));
    EXPECT_EQ(listener_.next(), "vanished");
}

TEST_F(ServiceTest, WhatAClientDoesIsSignalledOnceAndThePositionIsRight) {
    wait(client_.setRate(album, 1));
    EXPECT_EQ(listener_.next(), statusChanged);
    for (const double target : {5.0, 0.1, 8.0}) {
        wait(client_.setCurrentTime("First", target));
        EXPECT_NEAR(position(), target, 0.5); // the busy machine's time between the two calls
        const auto seeked = listener_.next();
        ASSERT_TRUE(seeked && seeked->starts_with("Seeked ")) << seeked.value_or("none");
        EXPECT_NEAR(std::stod(seeked->substr(7)) / 1e6, target, 0.5);
    }
    wait(client_.setRate(album, 2));
    EXPECT_EQ(listener_.next(), "Player: Rate");
    wait(client_.advanceToNextItem(album));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata CanGoNext");
    wait(client_.setRate(album, 0));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Rate");
    EXPECT_EQ(listener_.next(milliseconds(500)), std::nullopt);
    wait(client_.appendItem(album, "First"));
    EXPECT_EQ(listener_.next(), "Player: CanGoNext");
    wait(client_.removeAllItems(album));
    EXPECT_EQ(listener_.next(), "Player: PlaybackStatus Metadata CanGoNext CanPlay CanPause CanSeek");
}

TEST_F(ServiceTest, ACallInterruptsWhatPlays) {
    play();
    auto phone = call();
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    phone.reset();
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Playing\n");
    phone = call();
    ASSERT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(bus_.call({"Pause"}), ""); // and so it stays
    phone.reset();
    EXPECT_EQ(listener_.next(milliseconds(1000)), std::nullopt);
}

TEST_F(ServiceTest, WhatBeginsDuringACallWaitsForItsEnd) {
    auto phone = call();
    EXPECT_EQ(bus_.call({"Play"}), "");
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    phone.reset();
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Playing\n");
}

TEST_F(ServiceTest, TheSystemSleepsAndPlaybackWorksAfterIt) {
    FakeLoginManager manager(bus_.address());
    play();
    ASSERT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
    manager.prepareForSleep(true);
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_TRUE(manager.waitForLocks({}));
    EXPECT_TRUE(service_.logs("Pausing before the system sleeps"));
    // What the sound server does to its device when the system goes to sleep and wakes up.
    sound_.control({"suspend-sink", "out", "1"});
    sound_.control({"suspend-sink", "out", "0"});
    manager.prepareForSleep(false);
    play();
    EXPECT_TRUE(manager.waitForLocks({"idle:block", "sleep:delay"}));
}

TEST_F(ServiceTest, TheSoundServerKnowsTheStreamAndADeviceThatVanishesPauses) {
    play();
    const std::string streams = sound_.control({"list", "sink-inputs"});
    for (const char* property :
         {R"(media.role = "music")", R"(application.name = "tarnd")", R"(application.id = "ostrel.tarnd")",
          R"(module-stream-restore.id = "sink-input-by-application-id:ostrel.tarnd")"})
        EXPECT_THAT(streams, HasSubstr(property));
    sound_.control({"unload-module", "module-null-sink"});
    EXPECT_EQ(listener_.next(), statusChanged);
    EXPECT_EQ(status(), "Paused\n");
    EXPECT_TRUE(service_.logs("the device that played is gone"));
}

} // namespace
} // namespace tarn
