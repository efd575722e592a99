#pragma once

#include <memory>
#include <optional>
#include <string>

#include <gmock/gmock.h>

#include "controls/LinuxMediaControls.h"
#include "tests/controls/FakePlayer.h"
#include "tests/system/controls/PrivateBus.h"
#include "tests/system/controls/SignalListener.h"

namespace tarn {

/// The media controls on a bus of the test's own, with a fake player of an item.
class ControlsTest : public testing::Test {
protected:
    /// What it is signalled as that there is something to control, and that there is not.
    static constexpr char everything[] = "Player: PlaybackStatus Metadata CanGoNext CanPlay CanPause CanSeek";

    static NowPlayingInfo track(const std::string& title) {
        return {.title = title,
                .duration = 180.0,
                .elapsedTime = {},
                .playbackRate = {},
                .artist = "Someone",
                .albumTitle = "Songs"};
    }

    static std::optional<std::string> applicationName(const std::string& desktopEntry) {
        if (desktopEntry == "org.example.MusicBox")
            return "Music Box";
        return desktopEntry == "org.example.Blank" ? std::optional("\n\t ") : std::nullopt;
    }

    void publish(const NowPlayingInfo& info, const std::string& application = "org.example.MusicBox") {
        controls_->setParentApplication(NowPlayingService::Origin::local, application);
        controls_->setNowPlayingInfo(NowPlayingService::Origin::local, info,
                                     NowPlayingService::mergePolicyReplace);
        if (player_)
            player_->tell(player_->playback());
    }

    PlaybackState playing(float rate) const {
        return {.rate = rate, .item = item_, .position = {30, 1}, .hasNextItem = true};
    }

    /// The player comes to life the way queue players do: it publishes, then it registers. Returns when the
    /// name is on the bus.
    void bringPlayer(float rate = 0) {
        publish(track("First"));
        player_ = FakePlayer::make(controls_->remoteCommands(), playing(rate));
        ASSERT_EQ(listener_.next(), "appeared");
    }

    PrivateBus bus_;
    SignalListener listener_{bus_};
    std::unique_ptr<LinuxMediaControls> controls_ = std::make_unique<LinuxMediaControls>(
        applicationName, LinuxMediaControls::Addresses{bus_.address(), "unix:path=/nonexistent"});
    const std::shared_ptr<FakeItem> item_ = std::make_shared<FakeItem>();
    std::shared_ptr<FakePlayer> player_;
};

} // namespace tarn
