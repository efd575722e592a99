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
          mpris_(targets_, commands_, serviceName),
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
        const auto installed = application ? label(*application) : std::nullopt;
        board_->setApplication(installed.value_or(ownLabel()));
    }

    void publish(const NowPlayingInfo& info) { board_->setInfo(info); }

private:
    static ApplicationLabel ownLabel() { return {serviceName, ""}; }

    std::optional<ApplicationLabel> label(const std::string& application) const {
        const std::string name = busText(applicationName_(application).value_or(""));
        if (name.find_first_not_of(' ') == std::string::npos)
            return std::nullopt;
        return ApplicationLabel{name, busText(application)};
    }

    void refresh() {
        PublicationBoard::Publication published;
        const auto players = targets_.players([&] { published = board_->take(); });
        if (!players.empty())
            session_.open();
        state_ = state_.next(published.info, published.application,
                             players.empty() ? ListedPlayer{} : players.front());
        mpris_.show(state_, !players.empty());
        sleep_.setPlaying(state_.playbackStatus == PlaybackStatus::playing);
    }

    const ApplicationName applicationName_;
    BusLoop loop_;
    const std::shared_ptr<PublicationBoard> board_ =
        std::make_shared<PublicationBoard>(ownLabel(), [this] { loop_.post([this] { refresh(); }); });
    RemoteTargets targets_{[board = board_] { board->touch(); }, [board = board_] { board->show(); }};
    RemoteCommandThread commands_{loop_};
    MprisState state_;
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
