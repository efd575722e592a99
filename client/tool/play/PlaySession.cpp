#include "client/tool/play/PlaySession.h"

#include <poll.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <utility>

#include "client/tool/display/Columns.h"
#include "client/tool/display/Problem.h"

namespace tarn::tool {

namespace {

using namespace std::chrono_literals;

constexpr double seekStep = 10;
constexpr float rateStep = 0.25F;

constexpr auto answerLimit = 10s;
constexpr auto reconnectLimit = 20s; // an update of the service's package takes some
constexpr auto longSilence = 1s;
constexpr auto drawInterval = 250ms;
constexpr auto backgroundInterval = 1000ms; // a shell that gives the terminal back does not always tell

std::chrono::milliseconds timeUntil(std::chrono::steady_clock::time_point due) {
    return std::max(std::chrono::ceil<std::chrono::milliseconds>(due - std::chrono::steady_clock::now()),
                    0ms);
}

} // namespace

PlaySession::PlaySession(Options options)
    : options_(std::move(options)),
      terminal_(options_.keys),
      playback_(client_, options_.files, options_.playback,
                {.changed =
                     [this] {
                         isDirty_ = true;
                         if (options_.changed)
                             options_.changed(playback_);
                     },
                 .told = [this](const std::string& line) { display_.tell(line); },
                 .failed =
                     [this](const std::string& problem) {
                         display_.complain(printable(problem));
                         if (options_.failed)
                             options_.failed(problem);
                     },
                 .ended = [this](const std::string& reason, int status) { end(reason, status); }}),
      client_({.socketPath = options_.socketPath,
               .onEvent = [this](const client::Event& event) { playback_.handle(event); },
               .driver = client::Driver::program,
               .reconnectLimit = reconnectLimit}),
      status_(options_.hasFailedBefore ? 1 : 0) {}

int PlaySession::run() {
    askWhetherTheServiceAnswers();
    while (!hasEnded_) {
        waitForSomething();
        client_.drainEvents();
        takeSignals();
        takeKeys();
        tick();
        if (std::exchange(isDirty_, false) && !hasEnded_)
            draw();
    }
    display_.clear();
    terminal_.giveBack();
    if (!reason_.empty())
        display_.say(reason_);
    return status_;
}

/// A service manager holds the socket and lets programs connect even when the service itself does not come
/// up.
void PlaySession::askWhetherTheServiceAnswers() {
    answerDue_ = Clock::now() + answerLimit;
    client_.connection().call({}, [this](const client::Answer&) { // a command that asks for nothing
        hasAnswered_ = true;
        takeTerminal();
        playback_.begin();
    });
}

void PlaySession::waitForSomething() {
    std::array<pollfd, 3> sources = {{{client_.eventDescriptor(), POLLIN, 0},
                                      {signals_.descriptor(), POLLIN, 0},
                                      {isForeground_ ? terminal_.keyDescriptor() : -1, POLLIN, 0}}};
    ::poll(sources.data(), sources.size(), static_cast<int>(longestWait().count()));
    keysWait_ = sources[2].revents != 0;
}

/// -1 when only others can bring news.
std::chrono::milliseconds PlaySession::longestWait() const {
    if (!hasAnswered_)
        return timeUntil(answerDue_);
    if (playback_.goneSince() && !silenceTold_)
        return timeUntil(*playback_.goneSince() + longSilence);
    if (!terminal_.isLive())
        return -1ms;
    if (!isForeground_)
        return backgroundInterval;
    return playback_.isPlaying() ? timeUntil(questionDue_) : -1ms;
}

void PlaySession::takeSignals() {
    while (const auto signal = signals_.take()) {
        if (*signal == SIGTSTP)
            stopHere();
        else if (*signal == SIGCONT)
            isForeground_ = false; // another program may have changed the terminal meanwhile
        else if (*signal == SIGWINCH)
            redraw();
        else
            end("Stopped.", 128 + *signal);
    }
}

/// ^Z: the shell gets its terminal back as it was. What plays goes on playing.
void PlaySession::stopHere() {
    for (const auto key : terminal_.readKeysBeforeSignal())
        press(key);
    display_.clear();
    terminal_.giveBack();
    isForeground_ = false;
    signals_.stopHere();
}

void PlaySession::redraw() {
    display_.clear();
    isDirty_ = true;
}

void PlaySession::takeTerminal() {
    terminal_.takeKeys();
    isForeground_ = terminal_.isForeground();
    redraw();
    if (!isForeground_)
        return;
    if (terminal_.keyDescriptor() >= 0 && !std::exchange(keysExplained_, true))
        display_.say("space pause   n next   left/right seek   [ ] rate   q quit   ^Z to the background");
    display_.catchUp();
}

void PlaySession::takeKeys() {
    if (!std::exchange(keysWait_, false) || terminal_.keyDescriptor() < 0 || !terminal_.isForeground())
        return;
    for (const auto key : terminal_.readKeys())
        press(key);
    isDirty_ = true;
}

void PlaySession::press(Key key) {
    switch (key) {
    case Key::pause:
        return playback_.pauseOrGoOn();
    case Key::next:
        return playback_.skip();
    case Key::seekBack:
        return playback_.seekBy(-seekStep);
    case Key::seekForward:
        return playback_.seekBy(seekStep);
    case Key::slower:
        return playback_.changeRateBy(-rateStep);
    case Key::faster:
        return playback_.changeRateBy(rateStep);
    case Key::quit:
        return end("Stopped.", status_);
    }
}

void PlaySession::tick() {
    if (!hasAnswered_) {
        if (Clock::now() >= answerDue_)
            throw Problem("the service does not answer",
                          "Its log may say why: systemctl --user status tarnd");
        return;
    }
    tellOfLongSilence();
    if (!terminal_.isLive())
        return;
    if (isForeground_ != terminal_.isForeground())
        takeTerminal();
    if (!isForeground_ || !playback_.isPlaying() || Clock::now() < questionDue_)
        return;
    questionDue_ = Clock::now() + drawInterval;
    playback_.askPosition();
    isDirty_ = true; // should the answer not come
}

/// A service that crashed or is being updated is back before anybody needs to know.
void PlaySession::tellOfLongSilence() {
    const auto since = playback_.goneSince();
    const bool lasts = since && Clock::now() - *since >= longSilence;
    if (std::exchange(silenceTold_, lasts) == lasts)
        return;
    display_.say(lasts ? "The service is gone; waiting for it to come back." : "The service is back.");
    isDirty_ = true;
}

void PlaySession::draw() {
    const auto* track = playback_.current();
    if (track == nullptr)
        return;
    LiveState state{{},
                    track->title(),
                    track->info.artist.value_or(""),
                    playback_.position(),
                    track->info.duration,
                    playback_.isPaused(),
                    playback_.usualRate()};
    if (playback_.size() > 1)
        state.place = std::to_string(track->number) + "/" + std::to_string(playback_.size());
    display_.show(state);
}

void PlaySession::end(const std::string& reason, int status) {
    if (std::exchange(hasEnded_, true))
        return;
    reason_ = reason;
    status_ = std::max(status_, status);
}

} // namespace tarn::tool
