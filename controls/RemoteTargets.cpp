#include "controls/RemoteTargets.h"

#include <algorithm>
#include <mutex>
#include <utility>

namespace tarn {

namespace {

struct Target {
    const ControllablePlayer* player; // never followed
    RemoteCommand::Handler handler;
};

/// What a command and its registrations share.
struct TargetList {
    std::mutex mutex;
    std::vector<std::shared_ptr<Target>> targets;
    bool enabled = true;
};

class TargetRegistration final : public Registration {
public:
    TargetRegistration(std::shared_ptr<TargetList> list, std::shared_ptr<Target> target)
        : list_(std::move(list)), target_(std::move(target)) {}

    ~TargetRegistration() override {
        const std::lock_guard lock(list_->mutex);
        std::erase(list_->targets, target_);
    }

private:
    const std::shared_ptr<TargetList> list_;
    const std::shared_ptr<Target> target_;
};

} // namespace

class RemoteTargets::Command final : public RemoteCommand {
public:
    RegistrationHandle addTarget(const ControllablePlayer& player, Handler handler) override {
        auto target = std::make_shared<Target>(Target{&player, std::move(handler)});
        const std::lock_guard lock(list_->mutex);
        list_->targets.push_back(target);
        return std::make_unique<TargetRegistration>(list_, std::move(target));
    }

    void setEnabled(bool enabled) override {
        const std::lock_guard lock(list_->mutex);
        list_->enabled = enabled;
    }

    RemoteCommandResult ask(const ControllablePlayer& player) const {
        const auto target = targetOf(player);
        return target ? target->handler() : RemoteCommandResult::noSuchContent;
    }

private:
    std::shared_ptr<Target> targetOf(const ControllablePlayer& player) const {
        const std::lock_guard lock(list_->mutex);
        const auto found =
            std::ranges::find(list_->targets, &player, [](const auto& target) { return target->player; });
        return list_->enabled && found != list_->targets.end() ? *found : nullptr;
    }

    const std::shared_ptr<TargetList> list_ = std::make_shared<TargetList>();
};

/// Tells of the player's end as well.
class RemoteTargets::PlayerRegistration final : public Registration {
public:
    PlayerRegistration(RegistrationHandle membership, std::function<void()> changed)
        : membership_(std::move(membership)), changed_(std::move(changed)) {}

    ~PlayerRegistration() override {
        membership_.reset();
        changed_();
    }

private:
    RegistrationHandle membership_;
    const std::function<void()> changed_;
};

RemoteTargets::RemoteTargets(std::function<void()> changed, std::function<void()> used)
    : changed_(std::move(changed)), players_(std::move(used)) {
    for (auto& command : commands_)
        command = std::make_unique<Command>();
}

RemoteTargets::~RemoteTargets() = default;

RemoteCommand& RemoteTargets::pauseCommand() { return command(RemoteCommandKind::pause); }
RemoteCommand& RemoteTargets::playCommand() { return command(RemoteCommandKind::play); }
RemoteCommand& RemoteTargets::togglePlayPauseCommand() { return command(RemoteCommandKind::togglePlayPause); }
RemoteCommand& RemoteTargets::nextTrackCommand() { return command(RemoteCommandKind::nextTrack); }
RemoteCommand& RemoteTargets::previousTrackCommand() { return command(RemoteCommandKind::previousTrack); }

RegistrationHandle RemoteTargets::addPlayer(std::weak_ptr<ControllablePlayer> player) {
    auto registration = std::make_unique<PlayerRegistration>(players_.add(std::move(player)), changed_);
    changed_();
    return registration;
}

void RemoteTargets::playerChanged(const ControllablePlayer& player) {
    players_.changed(player);
    changed_();
}

void RemoteTargets::playbackChanged(const ControllablePlayer& player) {
    players_.moved(player);
    changed_();
}

RemoteCommandResult RemoteTargets::deliver(RemoteCommandKind kind) {
    const auto players = players_.inOrder();
    if (players.empty())
        return RemoteCommandResult::noSuchContent;
    if (kind == RemoteCommandKind::togglePlayPause && players.front().playback.plays())
        kind = RemoteCommandKind::pause;
    const Command& asked = command(kind);
    RemoteCommandResult result = RemoteCommandResult::noSuchContent;
    if (kind != RemoteCommandKind::pause)
        return asked.ask(*players.front().player);
    // The one that was used last comes last, so that it still is the one to go on with.
    for (auto listed = players.rbegin(); listed != players.rend(); ++listed)
        if (const auto answer = asked.ask(*listed->player); result != RemoteCommandResult::success)
            result = answer;
    return result;
}

} // namespace tarn
