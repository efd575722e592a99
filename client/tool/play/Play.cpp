#include "client/tool/play/Play.h"

#include <poll.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cmath>
#include <csignal>
#include <iostream>
#include <map>
#include <optional>
#include <set>

#include "client/tool/display/LiveLine.h"
#include "client/tool/display/Problem.h"
#include "client/tool/display/Terminal.h"
#include "client/tool/display/TimeText.h"
#include "client/tool/play/EventInbox.h"
#include "client/tool/play/ServiceCheck.h"

namespace tarn::tool {

namespace {

using namespace std::chrono_literals;

constexpr double seekStep = 10;
constexpr float rateStep = 0.25F;
constexpr float slowestRate = 0.25F;
constexpr float fastestRate = 4;
constexpr std::chrono::milliseconds liveInterval = 250ms;
constexpr std::chrono::milliseconds plainInterval = 1000ms;
constexpr int mostRestarts = 3;

/// Of its own for each use of the tool; the last component names it to the system's media controls.
std::string ownPlayerIdentifier() { return "tarnctl-" + std::to_string(::getpid()) + ",ostrel.tarnctl"; }

sigset_t stopSignals() {
    sigset_t set;
    sigemptyset(&set);
    sigaddset(&set, SIGINT);
    sigaddset(&set, SIGTERM);
    return set;
}

/// The stop signals as something to wait for. To be made before any thread.
FileDescriptor waitForSignals() {
    const auto set = stopSignals();
    pthread_sigmask(SIG_BLOCK, &set, nullptr);
    return FileDescriptor(::signalfd(-1, &set, SFD_CLOEXEC | SFD_NONBLOCK));
}

/// While it lives, a stop signal ends the tool at once. For its first thread, while that waits for answers.
class StoppingAtOnce {
public:
    StoppingAtOnce() { pthread_sigmask(SIG_UNBLOCK, &signals_, nullptr); }
    ~StoppingAtOnce() { pthread_sigmask(SIG_BLOCK, &signals_, nullptr); }
    StoppingAtOnce(const StoppingAtOnce&) = delete;
    StoppingAtOnce& operator=(const StoppingAtOnce&) = delete;

private:
    const sigset_t signals_ = stopSignals();
};

template <class... Handlers>
struct Overloaded : Handlers... {
    using Handlers::operator()...;
};
template <class... Handlers>
Overloaded(Handlers...) -> Overloaded<Handlers...>;

class PlaySession {
public:
    explicit PlaySession(const PlayOptions& options) : options_(options), usualRate_(options.rate) {}

    int run() {
        if (open())
            play();
        return status_;
    }

private:
    bool open() {
        const StoppingAtOnce whileItTakes;
        checkThatServiceAnswers(client_);
        openFiles();
        if (tracks_.empty())
            return false;
        const bool fromTheEnd = options_.rate < 0 && options_.from == 0;
        return makePlayer({tracks_.front().identifier,
                           fromTheEnd ? tracks_.front().info.duration : options_.from, options_.rate});
    }

    void openFiles() {
        tracks_ = openTracks(client_, options_.paths, options_.access,
                             [&](const auto& path, const auto& reason) { fail(path + ": " + reason); });
    }

    /// Where playing begins, or goes on.
    struct Place {
        std::string track;
        double position;
        float rate;
    };

    /// Of the tracks from that place on. False, with a line, when that cannot be.
    bool makePlayer(const Place& place) {
        std::vector<std::string> items;
        std::vector<std::future<client::Result<client::Status>>> made;
        for (const auto& track : tracks_) {
            if (items.empty() && track.identifier != place.track)
                continue;
            items.push_back(track.identifier);
            made.push_back(client_.upsertItem(track.identifier, track.identifier));
        }
        for (auto& item : made)
            item.wait();
        const auto player = client_.upsertQueuePlayer(playerIdentifier_, items).get();
        place_ = place;
        if (wasForgotten(player)) {
            goOnIfNobodyElseIsServed();
            return true;
        }
        if (player.outcome != client::Outcome::answered)
            return fail("cannot play: " + player.problem());
        if (place.position > 0)
            client_.setCurrentTime(place.track, place.position).wait();
        started_ = false;
        starting_ = client_.setRate(playerIdentifier_, place.rate);
        return true;
    }

    /// The service has lost its client: the one before this, that left only now, or this one to another that
    /// has come. The first is made good.
    void goOnIfNobodyElseIsServed() {
        if (++restarts_ > mostRestarts || !servesNobody(client_))
            return stop("Stopped: another program has taken over the service.", 1);
        if (current_ != nullptr && started_)
            place_ = {current_->identifier, position_, rate_};
        client_.reconnect();
        inbox_.takeAll(); // of what is no more
        current_ = nullptr;
        openFiles();
        const auto goesOn = std::any_of(tracks_.begin(), tracks_.end(),
                                        [&](const Track& track) { return track.identifier == place_.track; });
        if (!goesOn || !makePlayer(Place(place_)))
            stop("Stopped.", 1);
    }

    void play() {
        terminal_.takeKeys();
        if (terminal_.hasKeys())
            std::cout << "space pause   n next   left/right seek   [ ] rate   q quit\n";
        while (!ended_) {
            waitForSomething();
            for (const auto& event : inbox_.takeAll())
                handle(event);
            checkStart();
            takeSignals();
            if (keysWait_)
                for (const auto key : terminal_.readKeys())
                    handle(key);
            if (!ended_)
                readPosition();
            if (!ended_)
                draw();
        }
        clearLine();
        reportFailures();
        if (!stopReason_.empty())
            std::cout << stopReason_ << "\n";
    }

    void waitForSomething() {
        std::array<pollfd, 3> sources = {{{inbox_.descriptor(), POLLIN, 0},
                                          {signals_.get(), POLLIN, 0},
                                          {terminal_.hasKeys() ? STDIN_FILENO : -1, POLLIN, 0}}};
        const bool moves = rate_ != 0 || starting_.valid();
        const auto interval = terminal_.isLive() ? liveInterval : plainInterval;
        ::poll(sources.data(), sources.size(), moves ? static_cast<int>(interval.count()) : -1);
        keysWait_ = sources[2].revents != 0;
    }

    void handle(const client::Event& event) {
        std::visit(Overloaded{[&](const client::ItemStatusChanged& it) { takeStatus(it); },
                              [&](const client::ItemFailedToPlayToEnd& it) { failed_.try_emplace(it.item); },
                              [&](const client::PlayerRateChanged& it) { takeRate(it.rate); },
                              [&](const client::CurrentItemChanged& it) { takeCurrentItem(it.item); },
                              [&](const client::ConnectionLost&) {
                                  stop("Stopped: the connection to the service was lost.", 1);
                              },
                              [&](const client::TakenOver&) {
                                  stop("Stopped: another program has taken over the service.", 1);
                              },
                              [](const auto&) {}},
                   event);
    }

    void takeStatus(const client::ItemStatusChanged& event) {
        if (event.status.value == client::Status::Value::failed)
            failed_[event.item] = event.status.error;
    }

    void takeRate(float rate) {
        if (rate_ < 0 && rate == 0 && readPosition() && position_ == 0)
            return stop("Played back to the start.", status_);
        if (!terminal_.isLive() && rate == 0 && rate_ != 0 && current_ != nullptr)
            std::cout << "Paused at " << timeText(position_) << "." << std::endl;
        rate_ = rate;
        if (rate != 0)
            usualRate_ = rate;
    }

    void takeCurrentItem(const std::optional<std::string>& item) {
        const bool had = current_ != nullptr;
        current_ = nullptr;
        for (const auto& track : tracks_)
            if (item == track.identifier)
                current_ = &track;
        if (had || current_ != nullptr)
            reportFailures();
        if (current_ == nullptr && had)
            stop(status_ == 0 ? "Played everything." : "Stopped at the end.", status_);
        else if (current_ != nullptr && !terminal_.isLive())
            std::cout << "Playing " << printable(current_->title()) << " ("
                      << timeText(current_->info.duration) << ")" << std::endl;
        position_ = 0;
    }

    /// A rate that was asked for and did not come means that the sound output could not be had.
    void checkStart() {
        if (!starting_.valid() || starting_.wait_for(0ms) != std::future_status::ready)
            return;
        const auto completion = starting_.get();
        if (wasForgotten(completion))
            return goOnIfNobodyElseIsServed();
        for (const auto& event : inbox_.takeAll())
            handle(event);
        if (!completion.succeeded())
            return stop("Stopped: " + completion.problem(), 1);
        const bool isSilent = rate_ == 0 && place_.rate != 0 && current_ != nullptr;
        if (isSilent && readPosition())
            return stop("Stopped: the service could not start to play.", 1);
        started_ = !isSilent;
    }

    void takeSignals() {
        signalfd_siginfo signal{};
        if (::read(signals_.get(), &signal, sizeof(signal)) == static_cast<ssize_t>(sizeof(signal)))
            stop("Stopped.", 128 + static_cast<int>(signal.ssi_signo));
    }

    void handle(Key key) {
        const auto setRate = [&](float rate) {
            starting_ = {}; // whatever became of that, this comes after it
            started_ = true;
            client_.setRate(playerIdentifier_, rate);
        };
        switch (key) {
        case Key::pause:
            return setRate(rate_ == 0 ? usualRate_ : 0);
        case Key::next:
            client_.advanceToNextItem(playerIdentifier_);
            return;
        case Key::seekBack:
            return seek(-seekStep);
        case Key::seekForward:
            return seek(seekStep);
        case Key::slower:
            return setRate(std::clamp(usualRate_ - rateStep, slowestRate, fastestRate));
        case Key::faster:
            return setRate(std::clamp(usualRate_ + rateStep, slowestRate, fastestRate));
        case Key::quit:
            return stop("Stopped.", status_);
        }
    }

    void seek(double seconds) {
        if (current_ != nullptr)
            client_.setCurrentTime(current_->identifier, std::max(0.0, position_ + seconds)).wait();
    }

    /// False when nothing is known: also when the service has lost this client, which is seen to.
    bool readPosition() {
        if (current_ == nullptr)
            return false;
        const auto time = client_.currentTime(current_->identifier).get();
        if (time.outcome == client::Outcome::failed)
            goOnIfNobodyElseIsServed();
        if (time.outcome != client::Outcome::answered)
            return false;
        position_ = time.value;
        restarts_ = 0;
        return true;
    }

    void draw() const {
        if (!terminal_.isLive() || current_ == nullptr)
            return;
        const LiveState state{current_->title(), current_->info.artist.value_or(""), position_,
                              current_->info.duration, rate_};
        std::cout << "\r\x1b[K" << liveLine(state, terminal_.columns(), terminal_.hasColor()) << std::flush;
    }

    void clearLine() const {
        if (terminal_.isLive())
            std::cout << "\r\x1b[K" << std::flush;
    }

    void reportFailures() {
        for (const auto& [item, error] : failed_) {
            if (!reported_.insert(item).second)
                continue;
            for (const auto& track : tracks_)
                if (track.identifier == item)
                    fail(track.path + ": " + (error ? error->summary() : "could not be played to its end"));
        }
    }

    bool fail(const std::string& problem) {
        clearLine();
        std::cerr << "tarnctl: " << printable(problem) << "\n";
        status_ = 1;
        return false;
    }

    void stop(std::string reason, int status) {
        if (ended_)
            return;
        ended_ = true;
        stopReason_ = std::move(reason);
        status_ = std::max(status_, status);
    }

    const PlayOptions& options_;
    const FileDescriptor signals_ = waitForSignals(); // before the client's thread
    EventInbox inbox_;
    Terminal terminal_;
    const std::string playerIdentifier_ = ownPlayerIdentifier();
    std::vector<Track> tracks_;
    Place place_; // where the player in the service began
    int restarts_ = 0;
    const Track* current_ = nullptr;
    double position_ = 0;
    float rate_ = 0;
    float usualRate_; // what to go on at after a pause
    std::future<client::Completion> starting_;
    bool started_ = false;                                       // since then place_ is left behind
    std::map<std::string, std::optional<client::Error>> failed_; // by item
    std::set<std::string> reported_;
    bool keysWait_ = false;
    bool ended_ = false;
    std::string stopReason_;
    int status_ = 0;
    client::Client client_{{.socketPath = options_.socketPath,
                            .onEvent = [this](const client::Event& event) { inbox_.put(event); },
                            .reconnectLimit = 2s}};
};

} // namespace

int runPlay(const PlayOptions& options) {
    if (options.rate < 0 && options.paths.size() > 1)
        throw Problem("only one file can be played backwards", "Name one, or give a --rate over 0.", 2);
    return PlaySession(options).run();
}

} // namespace tarn::tool
