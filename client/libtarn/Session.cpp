#include "client/libtarn/Session.h"

#include <fcntl.h>
#include <sys/resource.h>

#include <algorithm>
#include <cerrno>
#include <system_error>
#include <utility>
#include <variant>

#include "client/libtarn/Decoding.h"
#include "client/libtarn/Shielded.h"
#include "client/libtarn/Token.h"
#include "ipc/TransportMessages.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
using client::Answer;
using client::Event;
using client::Outcome;
using Clock = std::chrono::steady_clock;
using Displacement = client::Connection::Displacement;

constexpr std::int64_t connectionLostCode = 25;

// A service that was killed is back within a tenth of a second, one that is installed anew within seconds.
constexpr std::chrono::milliseconds firstPause = 25ms;
constexpr std::chrono::milliseconds longestPause = 250ms;

// Between questions for positions, since something began to move. What was heard begins to move late, and
// the clock of what is heard is not ours.
constexpr std::chrono::milliseconds firstQuestionPause = 100ms;
constexpr std::chrono::milliseconds longestQuestionPause = 8000ms;

bool isCancelled(const Answer& answer) {
    return answer.outcome == Outcome::failed && answer.error.code == connectionLostCode;
}

bool succeeded(const Answer& answer) {
    return answer.outcome == Outcome::answered || answer.outcome == Outcome::released;
}

FileDescriptor opened(const std::string& path) {
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!file)
        throw std::system_error(errno, std::generic_category(), path);
    return file;
}

/// Half of the descriptors are the program's. The system gives the lowest that is free.
bool mayBeKept(const FileDescriptor& file) {
    rlimit limit{};
    return ::getrlimit(RLIMIT_NOFILE, &limit) == 0 && static_cast<rlim_t>(file.get()) < limit.rlim_cur / 2;
}

/// What happened once and is not seen from how things are afterwards.
bool mustBeTold(const Event& event) {
    const auto* status = std::get_if<client::ItemStatusChanged>(&event);
    return std::holds_alternative<client::ItemPlayedToEnd>(event) ||
           std::holds_alternative<client::ItemFailedToPlayToEnd>(event) ||
           (status && status->status.value == client::Status::Value::failed);
}

bool changesWhatMoves(const Event& event) {
    return std::holds_alternative<client::PlayerRateChanged>(event) ||
           std::holds_alternative<client::CurrentItemChanged>(event) ||
           std::holds_alternative<client::ItemTimeJumped>(event);
}

} // namespace

Session::Session(Options options, std::function<void(Event)> report)
    : options_(std::move(options)),
      report_(std::move(report)),
      link_(std::make_shared<Link>(
          Link::Handlers{{.onEvent = [this](const client::Bytes& envelope) { handleEvent(envelope); },
                          .onLost = [this] { handleLoss(); },
                          .onDisplaced = [this](Displacement reason) { handleDisplacement(reason); }},
                         [this] { handleTime(); }},
          options_.socketPath, options_.driver)) {
    link_->connect(Link::Patience::waits);
    state_ = State::connected;
    link_->start();
}

Session::~Session() {
    link_->stop();
    endCalls(Outcome::connectionLost, [](const Call&) { return true; });
}

void Session::perform(Command command, AnswerHandler ended) {
    Link::requireThatItFits(command.envelope);
    Outcome problem = Outcome::connectionLost;
    {
        const std::lock_guard lock(mutex_);
        if (state_ == State::takenOver)
            problem = Outcome::takenOver;
        if (state_ == State::connected || state_ == State::away) {
            const auto id = nextCallId_++;
            const auto& call = calls_.emplace(id, Call{std::move(command), std::move(ended)}).first->second;
            if (state_ == State::connected)
                send(id, call);
            ended = nullptr;
        }
    }
    if (ended)
        ended({.outcome = problem});
    else
        link_->waitForRoom();
}

/// With the mutex. If there is no connection any more, what is done about it will also be done about this.
void Session::send(std::uint64_t id, const Call& call) {
    link_->call(call.command.envelope, [this, id](Answer answer) { finish(id, std::move(answer)); });
}

void Session::finish(std::uint64_t id, Answer answer) {
    AnswerHandler ended;
    {
        const std::lock_guard lock(mutex_);
        const auto found = calls_.find(id);
        if (found == calls_.end() || answer.outcome == Outcome::connectionLost)
            return;
        Call& call = found->second;
        if (isCancelled(answer) && state_ == State::takenOver) {
            answer = {.outcome = Outcome::takenOver};
        } else if (isCancelled(answer) && link_->tellsNews()) {
            call.cancelled = true; // the news says why
            return;
        }
        if (survives() && succeeded(answer) && call.command.learn)
            call.command.learn(mirror_, answer, Clock::now());
        ended = std::move(call.ended);
        calls_.erase(found);
    }
    shielded([&] { ended(std::move(answer)); });
}

void Session::endCalls(Outcome outcome, const std::function<bool(const Call&)>& which) {
    std::vector<AnswerHandler> ended;
    {
        const std::lock_guard lock(mutex_);
        std::erase_if(calls_, [&](auto& entry) {
            const bool ends = which(entry.second);
            if (ends)
                ended.push_back(std::move(entry.second.ended));
            return ends;
        });
    }
    for (const auto& handler : ended)
        shielded([&] { handler({.outcome = outcome}); });
}

void Session::handleEvent(const client::Bytes& envelope) {
    const auto event = decodeEvent(envelope);
    if (!event)
        return;
    if (survives()) {
        const std::lock_guard lock(mutex_);
        const bool isNews = mirror_.happened(*event, Clock::now());
        if (state_ == State::connected)
            noteAdvance(*event);
        if (state_ == State::away && mustBeTold(*event))
            untold_.push_back(*event);
        if (state_ == State::away || !isNews)
            return;
        if (changesWhatMoves(*event))
            watchPositions(*event);
    }
    report_(*event);
}

/// With the mutex. An advance whose effect was told is not asked for again.
void Session::noteAdvance(const Event& event) {
    const auto* change = std::get_if<client::CurrentItemChanged>(&event);
    const auto shown = std::ranges::find_if(calls_, [&](const auto& entry) {
        return change && entry.second.command.advances == change->player && !entry.second.hasShown;
    });
    if (shown != calls_.end())
        shown->second.hasShown = true;
}

void Session::handleLoss() {
    {
        const std::lock_guard lock(mutex_);
        if (state_ == State::lost || state_ == State::takenOver)
            return;
        if (state_ == State::away)
            return tryAgainLater();
    }
    leave();
}

void Session::handleDisplacement(Displacement reason) {
    if (reason == Displacement::forgotten)
        return handleLoss();
    bool wasAway = false;
    {
        const std::lock_guard lock(mutex_);
        if (state_ == State::lost || state_ == State::takenOver)
            return;
        wasAway = state_ == State::away;
        if (!wasAway)
            putAside();
        restoration_.reset();
        state_ = State::takenOver;
        setTimer();
    }
    endCalls(Outcome::takenOver, [&](const Call& call) { return wasAway || call.cancelled; });
    report_(client::TakenOver());
}

/// The connection is of no use any more: on to another one, or to the end.
void Session::leave() {
    if (!survives())
        return giveUp();
    {
        const std::lock_guard lock(mutex_);
        putAside();
        beginBeingAway();
        nextAttempt_ = Clock::now();
        setTimer();
    }
    report_(client::Reconnecting());
}

void Session::giveUp() {
    {
        const std::lock_guard lock(mutex_);
        state_ = State::lost;
        restoration_.reset();
        setTimer();
    }
    endCalls(Outcome::connectionLost, [](const Call&) { return true; });
    report_(client::ConnectionLost());
}

/// With the mutex. What the service has held is what it is to hold again.
void Session::putAside() {
    wanted_ = std::exchange(mirror_, Mirror());
    wanted_.stop(Clock::now());
}

/// With the mutex.
void Session::beginBeingAway() {
    state_ = State::away;
    deadline_ = Clock::now() + options_.reconnectLimit;
    pause_ = firstPause;
    nextQuestion_.reset();
    for (auto& [id, call] : calls_)
        call.cancelled = false;
}

/// With the mutex.
void Session::tryAgainLater() {
    restoration_.reset();
    nextAttempt_ = Clock::now() + pause_;
    pause_ = std::min(2 * pause_, longestPause);
    setTimer();
}

void Session::handleTime() {
    bool isTimeToConnect = false;
    bool isTooLate = false;
    {
        const std::lock_guard lock(mutex_);
        const auto now = Clock::now();
        isTooLate = state_ == State::away && now >= deadline_;
        isTimeToConnect = state_ == State::away && !isTooLate && !restoration_ && now >= nextAttempt_;
        if (state_ == State::connected && nextQuestion_ && now >= *nextQuestion_)
            askForPositions(mirror_.currentItems(true));
        setTimer();
    }
    if (isTooLate) {
        link_->disconnect();
        giveUp();
    } else if (isTimeToConnect) {
        tryToConnect();
    }
}

void Session::tryToConnect() {
    try {
        link_->connect(Link::Patience::givesUp);
    } catch (const std::system_error&) {
        const std::lock_guard lock(mutex_);
        return tryAgainLater();
    }
    beginRestoration();
}

void Session::reconnect() {
    const auto held = link_->loop().hold();
    {
        const std::lock_guard lock(mutex_);
        if (survives() && state_ == State::connected)
            putAside();
        restoration_.reset();
        state_ = State::lost;
        setTimer();
    }
    const auto endAllCalls = [this] { endCalls(Outcome::connectionLost, [](const Call&) { return true; }); };
    try {
        link_->connect(Link::Patience::waits);
    } catch (...) {
        endAllCalls();
        throw;
    }
    if (!survives())
        endAllCalls();
    {
        const std::lock_guard lock(mutex_);
        state_ = State::connected;
        if (survives())
            beginBeingAway();
    }
    if (survives())
        beginRestoration();
}

void Session::beginRestoration() {
    std::shared_ptr<Restoration> restoration;
    {
        const std::lock_guard lock(mutex_);
        mirror_ = Mirror();
        untold_.clear();
        restoration_ = std::make_shared<Restoration>(
            wanted_, Restoration::Handlers{
                         [this](const Command& command, auto ended) { sendForRestoration(command, ended); },
                         [this](const Mirror::GrantedFile& file) { return grantForRestoration(file); },
                         [this](const Restoration::Failures& failures) { endRestoration(failures); }});
        restoration = restoration_;
        setTimer();
    }
    restoration->begin();
}

/// An answer that says that nobody is served any more, or somebody else, is the end of this attempt.
void Session::sendForRestoration(const Command& command, const Restoration::Ended& ended) {
    link_->call(command.envelope, [this, learn = command.learn, ended](const Answer& answer) {
        if (answer.outcome == Outcome::connectionLost || isCancelled(answer))
            return;
        if (learn && succeeded(answer)) {
            const std::lock_guard lock(mutex_);
            learn(mirror_, answer, Clock::now());
        }
        ended(answer);
    });
}

void Session::endRestoration(const Restoration::Failures& failures) {
    std::vector<Event> events = {client::Reconnected()};
    {
        const std::lock_guard lock(mutex_);
        const auto changes = mirror_.changesSince(wanted_, failures);
        events.insert(events.end(), untold_.begin(), untold_.end());
        events.insert(events.end(), changes.begin(), changes.end());
        for (const auto& [token, file] : wanted_.grants())
            handOver(token, file);
        wanted_ = Mirror();
        restoration_.reset();
        state_ = State::connected;
        for (const auto& [id, call] : calls_)
            if (!call.hasShown)
                send(id, call);
        watchPositions(client::Reconnected());
    }
    for (auto& event : events)
        report_(std::move(event));
    endCalls(Outcome::released, [](const Call& call) { return call.hasShown; });
}

std::string Session::grantFile(const std::string& path) {
    auto file = std::make_shared<const FileDescriptor>(opened(path));
    auto token = makeToken();
    const std::lock_guard lock(mutex_);
    if (state_ == State::connected)
        handOver(token, {path, std::move(file)});
    else
        wanted_.fileGranted(token, {path, std::move(file)});
    return token;
}

std::optional<std::string> Session::grantForRestoration(const Mirror::GrantedFile& file) {
    auto token = makeToken();
    const std::lock_guard lock(mutex_);
    return handOver(token, file) ? std::optional(std::move(token)) : std::nullopt;
}

/// With the mutex. Gives the service a file, which is remembered; false when it cannot be opened any more.
bool Session::handOver(const std::string& token, Mirror::GrantedFile file) {
    FileDescriptor given(file.file ? ::fcntl(file.file->get(), F_DUPFD_CLOEXEC, 0) : -1);
    if (!given)
        given = FileDescriptor(::open(file.path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!given)
        return false;
    link_->send(FrameKind::extension, encodeExtension({token, file.path}), std::move(given));
    if (survives()) {
        if (file.file && !mayBeKept(*file.file))
            file.file.reset();
        mirror_.fileGranted(token, std::move(file));
    }
    return true;
}

std::optional<double> Session::positionWhileAway(const std::string& item) const {
    const std::lock_guard lock(mutex_);
    const auto& items = wanted_.items();
    const auto found = state_ == State::away ? items.find(item) : items.end();
    return found == items.end() ? std::nullopt : std::optional(found->second->position);
}

/// With the mutex. Something moves differently from now on: where it is, is asked at once, and again and
/// again while it moves.
void Session::watchPositions(const Event& cause) {
    auto items = mirror_.currentItems(false);
    const auto* jump = std::get_if<client::ItemTimeJumped>(&cause);
    if (jump && std::ranges::find(items, jump->item) == items.end())
        items.push_back(jump->item);
    questionPause_ = firstQuestionPause / 2;
    askForPositions(items);
    setTimer();
}

/// With the mutex.
void Session::askForPositions(const std::vector<std::string>& items) {
    for (const auto& item : items) {
        auto question = commands::currentTime(item);
        link_->call(question.envelope, [this, learn = std::move(question.learn)](const Answer& answer) {
            const std::lock_guard lock(mutex_);
            if (state_ == State::connected && succeeded(answer))
                learn(mirror_, answer, Clock::now());
        });
    }
    questionPause_ = std::min(2 * questionPause_, longestQuestionPause);
    nextQuestion_.reset();
    if (!mirror_.currentItems(true).empty())
        nextQuestion_ = Clock::now() + questionPause_;
}

/// With the mutex.
void Session::setTimer() {
    std::optional<Time> next;
    if (state_ == State::away)
        next = restoration_ ? deadline_ : std::min(nextAttempt_, deadline_);
    else if (state_ == State::connected)
        next = nextQuestion_;
    link_->loop().wakeAt(next);
}

} // namespace tarn
