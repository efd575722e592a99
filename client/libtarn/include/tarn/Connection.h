#pragma once

#include <functional>
#include <memory>
#include <string>

#include <tarn/Answer.h>

namespace tarn::client {

/// Where the service listens: "ostrel.tarnd" in XDG_RUNTIME_DIR, or in /run without it.
std::string defaultSocketPath();

/// Who waits for the service on behalf of the library.
enum class Driver {
    ownThread, ///< a thread of the library's own, on which handlers then run
    program,   ///< the program's main loop, by Client::eventDescriptor(): the library makes no thread
};

/// A connection to the service that carries envelopes as bytes, for programs that encode and decode messages
/// themselves. See Client.h for commands and events as C++ types.
///
/// The service serves one client at a time: whoever connects last takes over, and every change of connection
/// makes the service forget all objects. Losing the connection is therefore never hidden: reconnect() is
/// called by the program, which then builds its objects again. The connection itself outlasts being taken
/// over, and what is sent on it from then on is carried out among the other client's objects.
///
/// Any thread may call. Handlers run one at a time on a thread of the connection's own, in the order in which
/// the service spoke; they may call anything here but disconnect(), reconnect() and the destructor, should
/// not block, and must not throw: what they throw is dropped.
///
/// The thread blocks all signals, and nothing here raises SIGPIPE. A child that the program makes with fork()
/// has no part in the connection: there, calls end as `connectionLost` at once, and the parent's connection
/// is not touched by anything that the child does or by its end.
class Connection {
public:
    /// Why this connection is not the service's current one any more.
    enum class Displacement {
        takenOver, ///< another client has connected
        forgotten, ///< a client that had been replaced before has left, and nobody is the current client now
    };

    struct Handlers {
        std::function<void(const Bytes& envelope)> onEvent; ///< an event; may be empty
        std::function<void()> onLost; ///< the connection ended, after all its calls did; may be empty
        /// The service serves this connection no more, although it lasts. May be empty; a service that is
        /// older than this library does not tell.
        std::function<void(Displacement reason)> onDisplaced{};
    };
    using AnswerHandler = std::function<void(Answer answer)>;

    /// Connects. Throws std::system_error when nobody listens, access is denied, or who listens belongs to
    /// another user than this program's or root (EPERM).
    explicit Connection(Handlers handlers, std::string socketPath = defaultSocketPath());

    /// Ends what is pending as `connectionLost`; onLost is not called.
    ~Connection();

    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    // An envelope over 1 MiB throws std::length_error; nothing is sent then.

    /// Sends a command and calls `handler` once with how it ended. Waits only while more than 1 MiB of what
    /// was sent before has not been taken by the service, and never in a handler. Without a connection
    /// `handler` is called at once, on the calling thread.
    void call(const Bytes& envelope, AnswerHandler handler);

    /// Sends a command whose end is of no interest. False when there is no connection.
    bool send(const Bytes& envelope);

    /// Hands an open regular file to the service: `token`, given to the service in an asset's
    /// `sandboxExtensionToken`, then opens `path` with this program's rights, once. The token is any text
    /// that nobody guesses. `file` stays the caller's. False when there is no connection. Throws
    /// std::system_error when no descriptor is left to keep the file until it is sent.
    bool grant(const std::string& token, const std::string& path, int file);

    bool isConnected() const;

    /// Ends the connection if it lasts, as the destructor does. No handler runs any more when this returns.
    void disconnect();

    /// disconnect(), and connects anew. Throws as the constructor does; then there is no connection.
    void reconnect();

private:
    friend class Client;
    class Implementation;
    struct Within {};
    Connection(Within, std::unique_ptr<Implementation> implementation);
    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn::client
