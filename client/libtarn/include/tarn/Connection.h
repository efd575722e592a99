#pragma once

#include <functional>
#include <memory>
#include <string>

#include <tarn/Answer.h>

namespace tarn::client {

/// Where the service listens: "ostrel.tarnd" in XDG_RUNTIME_DIR, or in /run without it.
std::string defaultSocketPath();

/// A connection to the service that carries envelopes as bytes, for programs that encode and decode messages
/// themselves. See Client.h for commands and events as C++ types.
///
/// The service serves one client at a time: whoever connects last takes over, and every change of connection
/// makes the service forget all objects. Losing the connection is therefore never hidden: reconnect() is
/// called by the program, which then builds its objects again. The connection itself outlasts being taken
/// over: when commands fail with code 25, another client came, and reconnect() takes over again.
///
/// Any thread may call. Handlers run one at a time on a thread of the connection's own, in the order in which
/// the service spoke; they may call anything here but disconnect(), reconnect() and the destructor, should
/// not block, and must not throw.
class Connection {
public:
    struct Handlers {
        std::function<void(const Bytes& envelope)> onEvent; ///< an event; may be empty
        std::function<void()> onLost; ///< the connection ended, after all its calls did; may be empty
    };
    using AnswerHandler = std::function<void(Answer answer)>;

    /// Connects. Throws std::system_error when nobody listens or access is denied.
    explicit Connection(Handlers handlers, std::string socketPath = defaultSocketPath());

    /// Ends what is pending as `connectionLost`; onLost is not called.
    ~Connection();

    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    // An envelope over 1 MiB throws std::length_error; nothing is sent then.

    /// Sends a command and calls `handler` once with how it ended. Waits only while the
    /// service is behind with what was sent before. Without a connection `handler` is called at once, on the
    /// calling thread.
    void call(const Bytes& envelope, AnswerHandler handler);

    /// Sends a command whose end is of no interest. False when there is no connection.
    bool send(const Bytes& envelope);

    /// Hands an open regular file to the service: `token`, given to the service in an asset's
    /// `sandboxExtensionToken`, then opens `path` with this program's rights, once. The token is any text
    /// that nobody guesses. `file` stays the caller's. False when there is no connection.
    bool grant(const std::string& token, const std::string& path, int file);

    bool isConnected() const;

    /// Ends the connection if it lasts, as the destructor does. No handler runs any more when this returns.
    void disconnect();

    /// disconnect(), and connects anew. Throws std::system_error; then there is no connection.
    void reconnect();

private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn::client
