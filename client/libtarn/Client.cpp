#include "tarn/Client.h"

#include <poll.h>

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>

#include "client/libtarn/Command.h"
#include "client/libtarn/ConnectionImplementation.h"
#include "client/libtarn/Decoding.h"
#include "client/libtarn/EventQueue.h"
#include "client/libtarn/Session.h"
#include "client/libtarn/Shielded.h"

namespace tarn::client {

namespace {

using Clock = std::chrono::steady_clock;

std::string absolutePath(const std::string& path) {
    return std::filesystem::absolute(path).lexically_normal().string();
}

/// The future of what `start` gives to the handler that it is called with.
template <class Ending, class Start>
std::future<Ending> futureOf(Start start) {
    auto promise = std::make_shared<std::promise<Ending>>();
    auto future = promise->get_future();
    start([promise](Ending ending) { promise->set_value(std::move(ending)); });
    return future;
}

/// poll(2) waits at least this long.
int millisecondsUntil(std::optional<Clock::time_point> until) {
    if (!until)
        return -1;
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(*until - Clock::now()).count();
    return static_cast<int>(std::clamp<std::int64_t>(left, 0, 1'000'000));
}

} // namespace

std::string fileURL(const std::string& path) {
    constexpr std::string_view hexadecimalDigits = "0123456789ABCDEF";
    constexpr std::string_view plain = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._~/";
    std::string URL = "file://";
    for (const char character : absolutePath(path)) {
        const auto byte = static_cast<unsigned char>(character);
        if (plain.find(character) != std::string_view::npos)
            URL += character;
        else
            URL.append({'%', hexadecimalDigits[byte >> 4U], hexadecimalDigits[byte & 0xFU]});
    }
    return URL;
}

class [[gnu::visibility("hidden")]] Client::Implementation {
public:
    explicit Implementation(Options options)
        : driver_(options.driver),
          survives_(options.reconnectLimit.count() > 0),
          onEvent_(std::move(options.onEvent)),
          session_({std::move(options.socketPath), options.driver, options.reconnectLimit},
                   [this](Event event) { report(std::move(event)); }),
          connection_({}, std::make_unique<Connection::Implementation>(session_.link())) {}

    bool isLeftBehind() const { return session_.link()->mark().isLeftBehind(); }

    void perform(Command command, Handler<Completion> ended) {
        start(std::move(command), [ended = std::move(ended)](Answer answer) {
            if (ended)
                ended({answer.outcome, std::move(answer.error)});
        });
    }

    template <class Value>
    void ask(Command command, std::optional<Value>(*decode)(const Bytes&), Handler<Result<Value>> ended) {
        start(std::move(command), [decode, ended = std::move(ended)](Answer answer) {
            Result<Value> result{{answer.outcome, std::move(answer.error)}, {}};
            if (answer.data)
                result.value = decode(*answer.data).value_or(Value());
            if (ended)
                ended(std::move(result));
        });
    }

    std::optional<Event> nextEvent(std::optional<Clock::time_point> until) {
        if (isLeftBehind())
            return std::nullopt;
        if (driver_ == Driver::ownThread)
            return events_.pop(until);
        driveUntil([this] { return events_.isReady(); }, until);
        return events_.pop(Clock::now());
    }

    /// Waits on behalf of a program that lets its loop wait otherwise.
    void driveUntil(const std::function<bool()>& done, std::optional<Clock::time_point> until) {
        while (!done()) {
            session_.link()->loop().drain();
            if (done() || (until && Clock::now() >= *until))
                return;
            pollfd ready{session_.link()->loop().descriptor(), POLLIN, 0};
            ::poll(&ready, 1, millisecondsUntil(until));
        }
    }

    std::vector<Event> drainEvents() {
        if (isLeftBehind())
            return {};
        if (driver_ == Driver::program)
            session_.link()->loop().drain();
        return events_.popAll();
    }

    void reconnect() {
        if (isLeftBehind())
            throw std::system_error(ENOTCONN, std::generic_category(), "a client of the parent process");
        const auto held = session_.link()->loop().hold(); // no event comes of the connection from here on
        if (!survives_)
            events_.popAll();
        events_.begin();
        try {
            session_.reconnect();
        } catch (...) {
            events_.end();
            throw;
        }
    }

    std::optional<double> positionWhileAway(const std::string& item) const {
        return isLeftBehind() ? std::nullopt : session_.positionWhileAway(item);
    }

    std::string grantFile(const std::string& path) {
        if (isLeftBehind())
            throw std::system_error(ENOTCONN, std::generic_category(), path);
        return session_.grantFile(path);
    }

    int eventDescriptor() const {
        const bool isThere = driver_ == Driver::program && !isLeftBehind();
        return isThere ? session_.link()->loop().descriptor() : -1;
    }

    void driveUntil(const std::function<bool()>& done) {
        if (driver_ == Driver::program && !isLeftBehind())
            driveUntil(done, std::nullopt);
    }

    Connection& connection() { return connection_; }

private:
    void start(Command command, Connection::AnswerHandler ended) {
        if (isLeftBehind())
            ended(Answer{});
        else
            session_.perform(std::move(command), std::move(ended));
    }

    void report(Event event) {
        if (onEvent_)
            shielded([&] { onEvent_(event); });
        else
            events_.push(std::move(event));
    }

    const Driver driver_;
    const bool survives_;
    const std::function<void(const Event&)> onEvent_;
    EventQueue events_;
    Session session_; // goes before the rest, which its thread uses
    Connection connection_;
};

Client::Client() : Client(Options()) {}

Client::Client(Options options) : implementation_(std::make_unique<Implementation>(std::move(options))) {}

Client::~Client() {
    if (implementation_->isLeftBehind())
        (void)implementation_.release(); // its thread and its locks are the parent's
}

// Each command in its two forms.

std::future<Result<AssetInfo>> Client::upsertAsset(const AssetUpsert& asset) {
    return futureOf<Result<AssetInfo>>([&](auto ended) { upsertAsset(asset, ended); });
}

void Client::upsertAsset(const AssetUpsert& asset, Handler<Result<AssetInfo>> ended) {
    implementation_->ask(commands::upsertAsset(asset), decodeAssetInfo, std::move(ended));
}

std::future<Completion> Client::destroyAsset(const std::string& asset) {
    return futureOf<Completion>([&](auto ended) { destroyAsset(asset, ended); });
}

void Client::destroyAsset(const std::string& asset, Handler<Completion> ended) {
    implementation_->perform(commands::destroyAsset(asset), std::move(ended));
}

std::future<Result<Status>> Client::upsertItem(const std::string& item, const std::string& asset) {
    return futureOf<Result<Status>>([&](auto ended) { upsertItem(item, asset, ended); });
}

void Client::upsertItem(const std::string& item, const std::string& asset, Handler<Result<Status>> ended) {
    implementation_->ask(commands::upsertItem(item, asset), decodeStatus, std::move(ended));
}

std::future<Completion> Client::destroyItem(const std::string& item) {
    return futureOf<Completion>([&](auto ended) { destroyItem(item, ended); });
}

void Client::destroyItem(const std::string& item, Handler<Completion> ended) {
    implementation_->perform(commands::destroyItem(item), std::move(ended));
}

std::future<Result<double>> Client::currentTime(const std::string& item) {
    return futureOf<Result<double>>([&](auto ended) { currentTime(item, ended); });
}

void Client::currentTime(const std::string& item, Handler<Result<double>> ended) {
    if (const auto position = implementation_->positionWhileAway(item); position && ended)
        ended({{Outcome::answered, {}}, *position});
    else
        implementation_->ask(commands::currentTime(item), decodeCurrentTime, std::move(ended));
}

std::future<Completion> Client::setCurrentTime(const std::string& item, double seconds) {
    return futureOf<Completion>([&](auto ended) { setCurrentTime(item, seconds, ended); });
}

void Client::setCurrentTime(const std::string& item, double seconds, Handler<Completion> ended) {
    implementation_->perform(commands::setCurrentTime(item, seconds), std::move(ended));
}

std::future<Result<Status>> Client::upsertQueuePlayer(const std::string& player,
                                                      const std::vector<std::string>& items) {
    return futureOf<Result<Status>>([&](auto ended) { upsertQueuePlayer(player, items, ended); });
}

void Client::upsertQueuePlayer(const std::string& player, const std::vector<std::string>& items,
                               Handler<Result<Status>> ended) {
    implementation_->ask(commands::upsertQueuePlayer(player, items), decodeStatus, std::move(ended));
}

std::future<Completion> Client::destroyQueuePlayer(const std::string& player) {
    return futureOf<Completion>([&](auto ended) { destroyQueuePlayer(player, ended); });
}

void Client::destroyQueuePlayer(const std::string& player, Handler<Completion> ended) {
    implementation_->perform(commands::destroyQueuePlayer(player), std::move(ended));
}

std::future<Completion> Client::setRate(const std::string& player, float rate) {
    return futureOf<Completion>([&](auto ended) { setRate(player, rate, ended); });
}

void Client::setRate(const std::string& player, float rate, Handler<Completion> ended) {
    implementation_->perform(commands::setRate(player, rate), std::move(ended));
}

std::future<Completion> Client::advanceToNextItem(const std::string& player) {
    return futureOf<Completion>([&](auto ended) { advanceToNextItem(player, ended); });
}

void Client::advanceToNextItem(const std::string& player, Handler<Completion> ended) {
    implementation_->perform(commands::advanceToNextItem(player), std::move(ended));
}

std::future<Completion> Client::appendItem(const std::string& player, const std::string& item) {
    return futureOf<Completion>([&](auto ended) { appendItem(player, item, ended); });
}

void Client::appendItem(const std::string& player, const std::string& item, Handler<Completion> ended) {
    implementation_->perform(commands::appendItem(player, item), std::move(ended));
}

std::future<Completion> Client::removeItem(const std::string& player, const std::string& item) {
    return futureOf<Completion>([&](auto ended) { removeItem(player, item, ended); });
}

void Client::removeItem(const std::string& player, const std::string& item, Handler<Completion> ended) {
    implementation_->perform(commands::removeItem(player, item), std::move(ended));
}

std::future<Completion> Client::removeAllItems(const std::string& player) {
    return futureOf<Completion>([&](auto ended) { removeAllItems(player, ended); });
}

void Client::removeAllItems(const std::string& player, Handler<Completion> ended) {
    implementation_->perform(commands::removeAllItems(player), std::move(ended));
}

std::future<Completion> Client::replaceCurrentItem(const std::string& player, const std::string& item) {
    return futureOf<Completion>([&](auto ended) { replaceCurrentItem(player, item, ended); });
}

void Client::replaceCurrentItem(const std::string& player, const std::string& item,
                                Handler<Completion> ended) {
    implementation_->perform(commands::replaceCurrentItem(player, item), std::move(ended));
}

std::string Client::grantFile(const std::string& path) {
    return implementation_->grantFile(absolutePath(path));
}

std::optional<Event> Client::nextEvent(std::chrono::milliseconds limit) {
    return implementation_->nextEvent(Clock::now() + limit);
}

std::optional<Event> Client::nextEvent() { return implementation_->nextEvent(std::nullopt); }

int Client::eventDescriptor() const { return implementation_->eventDescriptor(); }

std::vector<Event> Client::drainEvents() { return implementation_->drainEvents(); }

void Client::driveUntil(const std::function<bool()>& done) { implementation_->driveUntil(done); }

void Client::reconnect() { implementation_->reconnect(); }

Connection& Client::connection() { return implementation_->connection(); }

} // namespace tarn::client
