#pragma once

#include <memory>
#include <optional>
#include <string>

#include <gmock/gmock.h>

#include "controls/LinuxMediaControls.h"
#include "tests/support/ChildProcess.h"
#include "tests/system/controls/BusListener.h"
#include "tests/system/controls/FakePlayer.h"
#include "tests/system/controls/PrivateBus.h"

namespace tarn {

/// The media controls on a bus of the test's own, with a fake player.
class ControlsTest : public testing::Test {
protected:
    /// What publishing nothing is signalled as, when something was shown before.
    static constexpr char cleared[] = "Player: PlaybackStatus Metadata CanGoNext CanPlay CanPause";

    static NowPlayingInfo track(const std::string& title, double elapsed, float rate) {
        return {.title = title,
                .duration = 180.0,
                .elapsedTime = elapsed,
                .playbackRate = rate,
                .artist = "Someone",
                .albumTitle = "Songs"};
    }

    static std::optional<std::string> applicationName(const std::string& desktopEntry) {
        if (desktopEntry == "org.example.MusicBox")
            return "Music Box";
        if (desktopEntry == "org.example.Blank")
            return "\n\t ";
        return std::nullopt;
    }

    void publish(const NowPlayingInfo& info,
                 const std::optional<std::string>& application = "org.example.MusicBox") {
        controls_->setParentApplication(NowPlayingService::Origin::local, application);
        controls_->setNowPlayingInfo(NowPlayingService::Origin::local, info,
                                     NowPlayingService::mergePolicyReplace);
    }

    /// The player comes to life the way queue players do: it publishes, then it registers.
    void bringPlayer(const NowPlayingInfo& info) {
        publish(info);
        player_ = std::make_unique<FakePlayer>(controls_->remoteCommands());
    }

    CommandResult playerctl(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {"playerctl", "--player=tarnd"});
        return runCommand(arguments, {bus_.environment()});
    }

    PrivateBus bus_;
    std::unique_ptr<LinuxMediaControls> controls_ = std::make_unique<LinuxMediaControls>(
        applicationName, LinuxMediaControls::Addresses{bus_.address(), "unix:path=/nonexistent"});
    std::unique_ptr<FakePlayer> player_;
};

} // namespace tarn
