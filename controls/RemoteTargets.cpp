#include "controls/RemoteTargets.h"

#include <algorithm>
#include <atomic>
#include <mutex>
#include <optional>
#include <utility>
#include <vector>

namespace tarn {

namespace {

/// One handler. `active` ends with the registration, so that a delivery that has already chosen its targets
/// passes over those that went.
struct Target {
    RemoteCommand::Handler handler;
    std::atomic<bool> active = true;
};

using Targets = std::vector<std::shared_ptr<Target>>;

/// What the command and its registrations share.
class TargetList {
public:
    explicit TargetList(std::function<void()> changed) : changed_(std::move(changed)) {}

    void add(std::shared_ptr<Target> target) {
        change([&] { targets_.push_back(std::move(target)); });
    }

    void remove(const std::shared_ptr<Target>& target) {
        target->active = false;
        change([&] { std::erase(targets_, target); });
    }

    void setEnabled(bool enabled) {
        change([&] { enabled_ = enabled; });
    }

    bool offered() const {
        const std::lock_guard lock(mutex_);
        return isOffered();
    }

    Targets newestFirst() const {
        const std::lock_guard lock(mutex_);
        return enabled_ ? Targets(targets_.rbegin(), targets_.rend()) : Targets();
    }

private:
    bool isOffered() const { return enabled_ && !targets_.empty(); }

    void change(const std::function<void()>& act) {
        bool before = false;
        bool after = false;
        {
            const std::lock_guard lock(mutex_);
            before = isOffered();
            act();
            after = isOffered();
        }
        if (before != after && changed_)
            changed_();
    }

    const std::function<void()> changed_;
    mutable std::mutex mutex_;
    Targets targets_; // oldest first
    bool enabled_ = true;
};

class TargetRegistration final : public Registration {
public:
    TargetRegistration(std::shared_ptr<TargetList> list, std::shared_ptr<Target> target)
        : list_(std::move(list)), target_(std::move(target)) {}
    ~TargetRegistration() override { list_->remove(target_); }

private:
    const std::shared_ptr<TargetList> list_;
    const std::shared_ptr<Target> target_;
};

/// Asks one after the other; the first success decides, and ends the asking unless everyone is to hear of it.
RemoteCommandResult ask(const Targets& targets, bool everyone) {
    std::optional<RemoteCommandResult> result;
    for (const auto& target : targets) {
        if (!target->active)
            continue;
        const RemoteCommandResult answer = target->handler();
        if (!result || answer == RemoteCommandResult::success)
            result = answer;
        if (answer == RemoteCommandResult::success && !everyone)
            break;
    }
    return result.value_or(RemoteCommandResult::noSuchContent);
}

} // namespace

class RemoteTargets::Command final : public RemoteCommand {
public:
    explicit Command(const std::function<void()>& changed) : list_(std::make_shared<TargetList>(changed)) {}

    RegistrationHandle addTarget(Handler handler) override {
        auto target = std::make_shared<Target>();
        target->handler = std::move(handler);
        auto registration = std::make_unique<TargetRegistration>(list_, target);
        list_->add(std::move(target));
        return registration;
    }

    void setEnabled(bool enabled) override { list_->setEnabled(enabled); }

    const TargetList& list() const { return *list_; }

private:
    const std::shared_ptr<TargetList> list_;
};

RemoteTargets::RemoteTargets(const std::function<void()>& changed) {
    for (auto& command : commands_)
        command = std::make_unique<Command>(changed);
}

RemoteTargets::~RemoteTargets() = default;

RemoteCommand& RemoteTargets::pauseCommand() { return command(RemoteCommandKind::pause); }
RemoteCommand& RemoteTargets::playCommand() { return command(RemoteCommandKind::play); }
RemoteCommand& RemoteTargets::togglePlayPauseCommand() { return command(RemoteCommandKind::togglePlayPause); }
RemoteCommand& RemoteTargets::nextTrackCommand() { return command(RemoteCommandKind::nextTrack); }
RemoteCommand& RemoteTargets::previousTrackCommand() { return command(RemoteCommandKind::previousTrack); }

bool RemoteTargets::offers(RemoteCommandKind kind) const { return command(kind).list().offered(); }

RemoteCommandResult RemoteTargets::deliver(RemoteCommandKind kind) {
    return ask(command(kind).list().newestFirst(), kind == RemoteCommandKind::pause);
}

} // namespace tarn
