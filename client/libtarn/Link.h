#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include <tarn/Connection.h>

#include "client/libtarn/LinkLoop.h"
#include "client/libtarn/Outgoing.h"
#include "client/libtarn/UnsharedDescriptor.h"
#include "ipc/FrameReader.h"
#include "ipc/Receiver.h"
#include "ipc/SocketAddress.h"

namespace tarn {

/// What is below a Connection and a Client: frames out and in, and who waits for which answer. It may be
/// connected and disconnected any number of times.
///
/// Calls are sent without waiting. What comes in is handled by the event loop, which calls the handlers.
class Link {
public:
    using AnswerHandler = client::Connection::AnswerHandler;

    /// How connect() takes a service that has too many clients waiting.
    enum class Patience { waits, givesUp };

    /// The handlers are called with the loop held, in the order in which the service spoke.
    struct Handlers {
        client::Connection::Handlers connection;
        std::function<void()> onTime{}; ///< see LinkLoop::wakeAt()
    };

    /// Not connected. The library's own thread waits from start() on. Throws std::system_error.
    Link(Handlers handlers, std::string path, client::Driver driver);
    Link(const Link&) = delete;
    Link& operator=(const Link&) = delete;
    ~Link() { stop(); }

    void start();

    /// Ends the thread and the connection. Not in a handler.
    void stop();

    /// disconnect(), and connects anew. Throws std::system_error; then there is no connection.
    ///
    /// The end of a connection that was taken over makes the service forget its current client, which might
    /// then come back at once. So that one is taken over first.
    void connect(Patience patience);

    /// Pending calls end as `connectionLost`. When this returns no handler runs any more, unless it is one
    /// that called this. onLost is not called.
    void disconnect();

    // The following are for any thread.

    /// Throws std::length_error for a body of more than 1 MiB, which the other two must not be given.
    static void requireThatItFits(const Data& body);

    /// Sends a call, or keeps it until the service takes more, and keeps the handler for its end. False when
    /// there is no connection; then the handler is left alone.
    bool call(const Data& body, AnswerHandler&& handler);

    /// The same with any other frame.
    bool send(FrameKind kind, const Data& body, FileDescriptor file = {});

    /// Waits while more than 1 MiB is kept, unless it is the caller who sends that.
    void waitForRoom();

    bool isConnected() const;

    /// Whether this service says when this client is displaced; known before the answer of any other call.
    bool tellsNews() const { return tellsNews_; }

    LinkLoop& loop() { return loop_; }
    const ForkMark& mark() const { return mark_; }

private:
    void handleSocket(std::uint32_t events);
    void serveSocket(std::uint32_t events);
    void read();
    void deliver(const Frame& frame);
    void tellDisplaced(client::Connection::Displacement reason);
    void takeOver(Patience patience);
    void end(bool tell);
    void flush();

    const ForkMark mark_;
    const client::Connection::Handlers handlers_;
    const SocketAddress address_;
    const std::string path_;
    const client::Driver driver_;

    // With the loop held.
    Receiver receiver_;
    std::optional<FrameReader> reader_;
    std::uint64_t connectionCount_ = 0;
    bool wasTakenOver_ = false;

    mutable std::mutex mutex_; // guards what follows up to the next blank line; taken after the loop
    UnsharedDescriptor socket_;
    bool connected_ = false;
    Outgoing outgoing_;
    bool socketIsFull_ = false;
    std::uint64_t nextCallId_ = 1;
    std::map<std::uint64_t, AnswerHandler> pending_; // in the order in which they were sent

    std::condition_variable roomMade_;
    std::atomic<bool> tellsNews_ = false;
    LinkLoop loop_; // goes first: its thread uses the rest
};

} // namespace tarn
