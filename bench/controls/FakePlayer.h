#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include "roles/ControllablePlayer.h"
#include "roles/RemoteCommandCenter.h"

namespace tarn {

/// A queue player as the media controls see it: it answers the commands and remembers them.
class FakePlayer final : public ControllablePlayer {
public:
    explicit FakePlayer(RemoteCommandCenter& center) {
        add(center.pauseCommand(), "pause");
        add(center.playCommand(), "play");
        add(center.togglePlayPauseCommand(), "toggle");
        add(center.nextTrackCommand(), "next");
        center.previousTrackCommand().setEnabled(false);
    }

    ~FakePlayer() override { letGo(); }

    FakePlayer(const FakePlayer&) = delete;
    FakePlayer& operator=(const FakePlayer&) = delete;

    PlaybackState playback() const override { return {}; }
    bool setRate(float) override { return true; }

    /// From now on handlers, or those of one command, wait for letGo(), like a play whose activation takes
    /// its time.
    void hold(const std::string& command = "") {
        const std::lock_guard lock(mutex_);
        held_ = true;
        heldCommand_ = command;
    }

    void letGo() {
        const std::lock_guard lock(mutex_);
        held_ = false;
        changed_.notify_all();
    }

    /// Waits until that many commands have begun.
    [[nodiscard]] bool waitForCommands(std::size_t count) {
        std::unique_lock lock(mutex_);
        return changed_.wait_for(lock, std::chrono::seconds(10), [&] { return commands_.size() >= count; });
    }

    std::vector<std::string> commands() {
        const std::lock_guard lock(mutex_);
        return commands_;
    }

private:
    void add(RemoteCommand& command, const char* name) {
        registrations_.push_back(command.addTarget(*this, [this, name] { return handle(name); }));
    }

    RemoteCommandResult handle(const char* name) {
        std::unique_lock lock(mutex_);
        commands_.emplace_back(name);
        changed_.notify_all();
        changed_.wait(lock, [&] { return !held_ || (!heldCommand_.empty() && heldCommand_ != name); });
        return RemoteCommandResult::success;
    }

    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<std::string> commands_;
    bool held_ = false;
    std::string heldCommand_; // empty: every one
    std::vector<RegistrationHandle> registrations_;
};

} // namespace tarn
