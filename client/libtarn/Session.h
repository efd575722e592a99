#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "client/libtarn/Command.h"
#include "client/libtarn/Link.h"
#include "client/libtarn/Mirror.h"
#include "client/libtarn/Restoration.h"

namespace tarn {

/// What a Client has to do with its connection: which command is sent when, how each ends, and what is done
/// about a loss.
///
///     connected ──loss──> away ──all is back──> connected
///         │                └──limit passed──> lost      } reconnect()
///         └──another program──> takenOver               } leads back
///
/// Every command is kept until it has ended. The loss of a connection ends none: commands wait while the
/// session is away, and are sent (again) behind the restoration, in the order in which they were given. That
/// carries each out once: the mirror, by which the objects are put back, knows of no command that has not
/// ended. Without a limit the session is never away, but lost at once.
///
/// Any thread may call, apart from what the header of Client says of handlers.
class Session {
public:
    using AnswerHandler = client::Connection::AnswerHandler;

    struct Options {
        std::string socketPath;
        client::Driver driver;
        std::chrono::milliseconds reconnectLimit;
    };

    /// Connects. `report` gets every event, one at a time, with the loop held. Throws std::system_error.
    Session(Options options, std::function<void(client::Event event)> report);
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    /// Ends every command as `connectionLost`. Not in a handler.
    ~Session();

    /// Calls `ended` once: by the loop, or at once when the command cannot be carried out.
    void perform(Command command, AnswerHandler ended);

    /// Hands a file to the service under a new token. Throws std::system_error.
    std::string grantFile(const std::string& path);

    /// Where an item goes on to play, while the session is away and knows it.
    std::optional<double> positionWhileAway(const std::string& item) const;

    /// See Client::reconnect(). Throws std::system_error.
    void reconnect();

    const std::shared_ptr<Link>& link() const { return link_; }

private:
    using Time = Mirror::Time;

    enum class State { connected, away, lost, takenOver };

    struct Call {
        Command command;
        AnswerHandler ended;
        bool cancelled = false; ///< by error 25: what that means is yet to come
        bool hasShown = false;  ///< an event has told what it asked for
    };
    using Calls = std::map<std::uint64_t, Call>; // in the order in which they were given

    bool survives() const { return options_.reconnectLimit.count() > 0; }

    // Calls.
    void send(std::uint64_t id, const Call& call);
    void finish(std::uint64_t id, client::Answer answer);
    void endCalls(client::Outcome outcome, const std::function<bool(const Call&)>& which);

    // What the link tells.
    void handleEvent(const client::Bytes& envelope);
    void handleLoss();
    void handleDisplacement(client::Connection::Displacement reason);
    void handleTime();
    void noteAdvance(const client::Event& event);

    // Going away and coming back.
    void leave();
    void giveUp();
    void putAside();
    void beginBeingAway();
    void tryAgainLater();
    void tryToConnect();
    void beginRestoration();
    void sendForRestoration(const Command& command, const Restoration::Ended& ended);
    void endRestoration(const Restoration::Failures& failures);
    std::optional<std::string> grantForRestoration(const Mirror::GrantedFile& file);
    bool handOver(const std::string& token, Mirror::GrantedFile file);

    // Knowing where playing is.
    void watchPositions(const client::Event& cause);
    void askForPositions(const std::vector<std::string>& items);
    void setTimer();

    const Options options_;
    const std::function<void(client::Event)> report_;

    mutable std::mutex mutex_; // guards what follows up to the next blank line; taken after the loop
    State state_ = State::lost;
    Calls calls_;
    std::uint64_t nextCallId_ = 1;
    Mirror mirror_; // what the service holds
    Mirror wanted_; // what it held when it was lost, until it holds that again
    std::shared_ptr<Restoration> restoration_;
    std::vector<client::Event> untold_; // of the time of the restoration
    Time deadline_{};
    Time nextAttempt_{};
    std::chrono::milliseconds pause_{};
    std::optional<Time> nextQuestion_; // for positions
    std::chrono::milliseconds questionPause_{};

    std::shared_ptr<Link> link_; // goes first: its thread uses the rest
};

} // namespace tarn
