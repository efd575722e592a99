#pragma once

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "roles/ControllablePlayer.h"
#include "roles/MediaAsset.h"
#include "roles/MediaItem.h"
#include "roles/RemoteCommandCenter.h"

namespace tarn {

/// An item of three minutes that remembers where it was moved to. Any thread may call.
class FakeItem final : public MediaItem, public MediaAsset {
public:
    RegistrationHandle observe(std::string_view, Block) override { return nullptr; }
    MediaStatus status() const override { return MediaStatus::readyToPlay; }
    std::optional<Error> error() const override { return std::nullopt; }
    const std::shared_ptr<MediaAsset>& asset() const override { return asset_; }
    MediaTime currentTime() const override { return MediaTime::zero(); }
    void seekToTime(MediaTime time) override {
        const std::lock_guard lock(mutex_);
        movedTo_.push_back(time.seconds());
    }

    const std::string& URL() const override { return URL_; }
    const std::vector<MediaMetadataItem>& commonMetadata() const override { return tags_; }
    MediaTime duration() const override { return {180, 1}; }

    std::vector<double> movedTo() const {
        const std::lock_guard lock(mutex_);
        return movedTo_;
    }

private:
    const std::shared_ptr<MediaAsset> asset_{std::shared_ptr<MediaAsset>(), this};
    const std::string URL_;
    const std::vector<MediaMetadataItem> tags_;
    mutable std::mutex mutex_;
    std::vector<double> movedTo_;
};

/// A queue player as the media controls see it: it does what it is told to be doing, answers commands and
/// remembers them. Any thread may call.
class FakePlayer final : public ControllablePlayer {
public:
    /// Registers itself like a queue player does.
    static std::shared_ptr<FakePlayer> make(RemoteCommandCenter& center, PlaybackState playback = {}) {
        auto player = std::make_shared<FakePlayer>(center, std::move(playback));
        player->add(center.pauseCommand(), "pause");
        player->add(center.playCommand(), "play");
        player->add(center.togglePlayPauseCommand(), "toggle");
        player->add(center.nextTrackCommand(), "next");
        center.previousTrackCommand().setEnabled(false);
        player->registrations_.push_back(center.addPlayer(player));
        return player;
    }

    FakePlayer(RemoteCommandCenter& center, PlaybackState playback)
        : center_(center), playback_(std::move(playback)) {}

    ~FakePlayer() override { letGo(); }

    PlaybackState playback() const override {
        const std::lock_guard lock(mutex_);
        return playback_;
    }

    bool setRate(float rate) override {
        handle("rate " + std::to_string(rate).substr(0, 4));
        return true;
    }

    /// From now on it does this, and has told nobody.
    void become(PlaybackState playback) {
        const std::lock_guard lock(mutex_);
        playback_ = std::move(playback);
    }

    void tell(PlaybackState playback) {
        become(std::move(playback));
        center_.playerChanged(*this);
    }

    void answerWith(RemoteCommandResult result) {
        const std::lock_guard lock(mutex_);
        result_ = result;
    }

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

    RemoteCommandResult handle(const std::string& name) {
        std::unique_lock lock(mutex_);
        commands_.push_back(name);
        changed_.notify_all();
        changed_.wait(lock, [&] { return !held_ || (!heldCommand_.empty() && heldCommand_ != name); });
        return result_;
    }

    RemoteCommandCenter& center_;
    mutable std::mutex mutex_;
    std::condition_variable changed_;
    PlaybackState playback_;
    std::vector<std::string> commands_;
    RemoteCommandResult result_ = RemoteCommandResult::success;
    bool held_ = false;
    std::string heldCommand_; // empty: every one
    std::vector<RegistrationHandle> registrations_;
};

} // namespace tarn
