#include "controls/LinuxMediaControls.h"

#include <cassert>
#include <utility>

#include "controls/BusAddress.h"
#include "controls/BusConnection.h"
#include "controls/BusLoop.h"
#include "controls/BusText.h"
#include "controls/MprisObject.h"
#include "controls/PublicationBoard.h"
#include "controls/RemoteCommandThread.h"
#include "controls/RemoteTargets.h"
#include "controls/SleepGuard.h"

namespace tarn {

namespace {

/// What the player is called on the bus, and for a person when its application has no name.
constexpr char serviceName[] = "tarnd";

} // namespace

/// The board and the targets are touched by any thread, the state and what hangs on the bus by the bus thread
/// only.
class LinuxMediaControls::Implementation {
public:
    Implementation(ApplicationName applicationName, Addresses addresses)
        : applicationName_(std::move(applicationName)),
          mpris_(commands_, serviceName),
          session_(loop_.event(), std::move(addresses.sessionBus), "session bus",
                   BusConnection::Report::outages, mpris_),
          sleep_(loop_, targets_, commands_, std::move(addresses.systemBus)) {
        loop_.start();
    }

    ~Implementation() {
        board_->close();
        loop_.stop();
    }

    RemoteTargets& targets() { return targets_; }

    /// The names are looked up here, on the caller's thread: the bus thread never waits for a disk.
    void setApplication(const std::optional<std::string>& application) {
        if (application)
            board_->setApplication(label(*application).value_or(ownLabel()));
        else
            board_->replaceApplication(ownLabel());
    }

    void publish(const NowPlayingInfo& info) { board_->publish(info); }

private:
    static ApplicationLabel ownLabel() { return {serviceName, ""}; }

    std::optional<ApplicationLabel> label(const std::string& application) const {
        const std::string name = busText(applicationName_(application).value_or(""));
        if (name.find_first_not_of(' ') == std::string::npos)
            return std::nullopt;
        return ApplicationLabel{name, busText(application)};
    }

    bool playerLives() const {
        for (const auto kind : {RemoteCommandKind::pause, RemoteCommandKind::play,
                                RemoteCommandKind::togglePlayPause, RemoteCommandKind::nextTrack})
            if (!targets_.offers(kind))
                return false;
        return true;
    }

    void refresh() {
        const PublicationBoard::Snapshot snapshot = board_->take();
        if (std::exchange(publicationSeen_, snapshot.number) != snapshot.number)
            state_ = state_.next({snapshot.info, snapshot.time, snapshot.application});
        else
            state_.application = snapshot.application;
        const bool alive = playerLives();
        if (alive)
            session_.open();
        mpris_.show(state_, alive);
        sleep_.setPlaying(alive && state_.playbackStatus == PlaybackStatus::playing);
    }

    const ApplicationName applicationName_;
    BusLoop loop_;
    const std::shared_ptr<PublicationBoard> board_ =
        std::make_shared<PublicationBoard>(ownLabel(), [this] { loop_.post([this] { refresh(); }); });
    RemoteTargets targets_{[board = board_] { board->touch(); }};
    RemoteCommandThread commands_{loop_, targets_};
    MprisState state_;
    std::uint64_t publicationSeen_ = 0;
    MprisObject mpris_;
    BusConnection session_;
    SleepGuard sleep_;
};

LinuxMediaControls::Addresses LinuxMediaControls::Addresses::fromEnvironment() {
    return {sessionBusAddress(), systemBusAddress()};
}

LinuxMediaControls::LinuxMediaControls(ApplicationName applicationName, Addresses addresses)
    : implementation_(std::make_unique<Implementation>(std::move(applicationName), std::move(addresses))) {}

LinuxMediaControls::~LinuxMediaControls() = default;

RemoteCommandCenter& LinuxMediaControls::remoteCommands() { return implementation_->targets(); }

void LinuxMediaControls::setParentApplication(Origin,
                                              const std::optional<std::string>& applicationIdentifier) {
    implementation_->setApplication(applicationIdentifier);
}

void LinuxMediaControls::setNowPlayingInfo(Origin, const NowPlayingInfo& info,
                                           [[maybe_unused]] int mergePolicy) {
    assert(mergePolicy == mergePolicyReplace);
    implementation_->publish(info);
}

} // namespace tarn
