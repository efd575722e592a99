#include "client/tool/play/Playback.h"

#include <unistd.h>

#include <algorithm>
#include <utility>

#include "client/tool/display/Columns.h"
#include "client/tool/display/TimeText.h"

namespace tarn::tool {

namespace {

constexpr float slowestRate = 0.25F;
constexpr float fastestRate = 4;

/// For how long a position is believed to run on when the service tells no other.
constexpr auto longestGuess = std::chrono::seconds(1);

constexpr auto ignore = [](const client::Completion&) {};

/// Of its own for each use of the tool; the last component names it to the system's media controls.
std::string ownPlayerIdentifier() { return "tarnctl-" + std::to_string(::getpid()) + ",ostrel.tarnctl"; }

template <class... Handlers>
struct Overloaded : Handlers... {
    using Handlers::operator()...;
};
template <class... Handlers>
Overloaded(Handlers...) -> Overloaded<Handlers...>;

} // namespace

Playback::Playback(client::Client& client, std::vector<std::string> files, const Options& options,
                   Listener listener)
    : client_(client),
      options_(options),
      listener_(std::move(listener)),
      player_(ownPlayerIdentifier()),
      queue_(client, player_, std::move(files), options.order, options.access,
             {.begins = [this] { start(); },
              .refused =
                  [this](const std::string& path, const std::string& reason) {
                      fail(path + ": " + reason);
                      endIfNothingIsLeft();
                  },
              .failed = [this](const std::string& problem) { end("Stopped: " + problem, 1); }}),
      usualRate_(options.rate) {}

void Playback::begin() {
    queue_.fill();
    endIfNothingIsLeft();
}

void Playback::start() {
    const bool fromTheEnd = options_.rate < 0 && options_.from == 0;
    const auto* first = current();
    const double from = fromTheEnd && first != nullptr ? first->info.duration : options_.from;
    if (from > 0 && first != nullptr)
        client_.setCurrentTime(first->identifier, from, ignore);
    setRate(usualRate_, [this](const client::Completion& completion) { takeStart(completion); });
}

/// A rate that was asked for and did not come means that the sound output could not be had.
void Playback::takeStart(const client::Completion& completion) {
    if (!completion.succeeded())
        return end("Stopped: " + completion.problem(), 1);
    if (rate_ == 0 && current_)
        return end("Stopped: the service could not start to play.", 1);
    hasStarted_ = true;
}

void Playback::handle(const client::Event& event) {
    std::visit(
        Overloaded{
            [&](const client::ItemStatusChanged& it) {
                if (it.status.value == client::Status::Value::failed)
                    noteFailure(it.item, it.status.error);
            },
            [&](const client::ItemFailedToPlayToEnd& it) { noteFailure(it.item, std::nullopt); },
            [&](const client::PlayerRateChanged& it) { takeRate(it.rate); },
            [&](const client::CurrentItemChanged& it) { takeCurrentItem(it.item); },
            [&](const client::Reconnecting&) { goneSince_ = Clock::now(); },
            [&](const client::Reconnected&) { goneSince_.reset(); },
            [&](const client::TakenOver&) { end("Stopped: another program has taken over the service.", 1); },
            [&](const client::ConnectionLost&) {
                end("Stopped: the connection to the service was lost.", 1);
            },
            [](const auto&) {}},
        event);
    listener_.changed();
}

void Playback::takeRate(float rate) {
    const float before = std::exchange(rate_, rate);
    position_ = position();
    positionTime_ = Clock::now();
    if (rate == 0 && before != 0 && current_) {
        asksWhy_ = before < 0 ? Stop::backwards : Stop::pause;
        askPosition();
    }
    if (ratesAsked_ > 0 || !current_)
        return; // what is wanted is known already
    wantsToPlay_ = rate != 0;
    if (rate == 1 && before == 0 && usualRate_ != 1)
        setRate(usualRate_); // others that let it go on know no other rate than 1
    else if (rate != 0)
        usualRate_ = rate;
}

void Playback::takeCurrentItem(const std::optional<std::string>& item) {
    current_ = queue_.goOnTo(item);
    wantedPosition_.reset();
    position_ = 0;
    positionTime_ = Clock::now();
    reportUnexplained();
    if (current_)
        listener_.told("Playing " + printable(current_->title()) + " (" + timeText(current_->info.duration) +
                       ")");
    if (current_ && hasStarted_ && wantsToPlay_ && rate_ == 0)
        setRate(usualRate_); // the queue had run dry
    endIfNothingIsLeft();
}

void Playback::askPosition() {
    if (!current_ || positionAsked_)
        return;
    positionAsked_ = true;
    client_.currentTime(
        current_->identifier, [this, item = current_->identifier](const client::Result<double>& time) {
            positionAsked_ = false;
            if (time.outcome == client::Outcome::answered && current_ && current_->identifier == item)
                takePosition(time.value);
        });
}

void Playback::takePosition(double position) {
    position_ = position;
    positionTime_ = Clock::now();
    const auto stop = std::exchange(asksWhy_, Stop::none);
    if (stop == Stop::backwards && position == 0 && rate_ == 0)
        return end("Played back to the start.", 0);
    if (stop != Stop::none && rate_ == 0)
        listener_.told("Paused at " + timeText(position) + ".");
    listener_.changed();
}

double Playback::position() const {
    if (wantedPosition_)
        return *wantedPosition_;
    const std::chrono::duration<double> passed =
        std::min<Clock::duration>(Clock::now() - positionTime_, longestGuess);
    const double end = current_ ? current_->info.duration : 0;
    return std::clamp(position_ + passed.count() * static_cast<double>(rate_), 0.0, std::max(position_, end));
}

void Playback::pauseOrGoOn() {
    wantsToPlay_ = !wantsToPlay_;
    setRate(wantsToPlay_ ? usualRate_ : 0);
}

void Playback::skip() { queue_.skip(); }

void Playback::changeRateBy(float step) {
    usualRate_ = std::clamp(usualRate_ + step, slowestRate, fastestRate);
    if (wantsToPlay_)
        setRate(usualRate_);
}

void Playback::setRate(float rate, const client::Client::Handler<client::Completion>& ended) {
    ++ratesAsked_;
    client_.setRate(player_, rate, [this, ended](const client::Completion& completion) {
        --ratesAsked_;
        if (ended)
            ended(completion);
        if (ratesAsked_ == 0 && current_)
            wantsToPlay_ = rate_ != 0;
        listener_.changed();
    });
}

void Playback::seekBy(double seconds) {
    if (!current_)
        return;
    wantedPosition_ = std::clamp(position() + seconds, 0.0, current_->info.duration);
    ++seeksAsked_;
    client_.setCurrentTime(current_->identifier, *wantedPosition_, [this](const client::Completion&) {
        if (--seeksAsked_ > 0)
            return;
        position_ = position();
        positionTime_ = Clock::now();
        wantedPosition_.reset();
        askPosition();
    });
}

/// A failed item tells its status with the reason, and that it was not played to its end without one, in
/// either order.
void Playback::noteFailure(const std::string& item, const std::optional<client::Error>& error) {
    queue_.leaveOut(item);
    const auto* path = queue_.pathOf(item);
    if (path == nullptr || reported_.contains(item))
        return;
    if (!error) {
        unexplained_[item] = *path;
        return;
    }
    unexplained_.erase(item);
    reported_.insert(item);
    fail(*path + ": " + error->summary());
}

void Playback::reportUnexplained() {
    for (const auto& [item, path] : std::exchange(unexplained_, {})) {
        reported_.insert(item);
        fail(path + ": it could not be played to its end");
    }
}

void Playback::fail(const std::string& problem) {
    hasFailed_ = true;
    listener_.failed(problem);
}

void Playback::endIfNothingIsLeft() {
    if (current_ || !queue_.isAtEnd())
        return;
    reportUnexplained();
    end(!hasStarted_ ? "" : hasFailed_ ? "Stopped at the end." : "Played everything.", 0);
}

void Playback::end(const std::string& reason, int status) {
    if (!std::exchange(hasEnded_, true))
        listener_.ended(reason, std::max(status, hasFailed_ ? 1 : 0));
}

} // namespace tarn::tool
