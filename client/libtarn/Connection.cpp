#include "tarn/Connection.h"

#include <sys/socket.h>

#include <cassert>
#include <cerrno>
#include <cstring>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <system_error>
#include <thread>
#include <unordered_map>
#include <utility>

#include "ipc/FrameReader.h"
#include "ipc/Receiver.h"
#include "ipc/SocketAddress.h"
#include "ipc/TransportMessages.h"

namespace tarn::client {

namespace {

Answer answerOf(const Frame& frame) {
    if (frame.kind == FrameKind::released)
        return {Outcome::released, {}, {}};
    auto reply = decodeReply(frame.body);
    if (!reply)
        return {Outcome::released, {}, {}};
    if (reply->error)
        return {Outcome::failed, {}, {reply->error->domain, reply->error->code, reply->error->userInfo}};
    return {Outcome::answered, std::move(reply->data), {}};
}

void requireThatItFits(const Bytes& body) {
    if (body.size() > FrameHeader::largestBody)
        throw std::length_error("an envelope has at most 1 MiB");
}

/// Sends everything, with a file beside the first byte unless it is -1. False when the connection has ended.
bool sendAll(int socket, std::span<const std::uint8_t> bytes, int file) {
    alignas(cmsghdr) std::array<std::byte, CMSG_SPACE(sizeof(int))> control{};
    while (!bytes.empty()) {
        iovec part{const_cast<std::uint8_t*>(bytes.data()), bytes.size()};
        msghdr message{};
        message.msg_iov = &part;
        message.msg_iovlen = 1;
        if (file >= 0) {
            message.msg_control = control.data();
            message.msg_controllen = control.size();
            cmsghdr* header = CMSG_FIRSTHDR(&message);
            header->cmsg_level = SOL_SOCKET;
            header->cmsg_type = SCM_RIGHTS;
            header->cmsg_len = CMSG_LEN(sizeof(int));
            std::memcpy(CMSG_DATA(header), &file, sizeof(int));
        }
        const auto count = ::sendmsg(socket, &message, MSG_NOSIGNAL);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return false;
        bytes = bytes.subspan(static_cast<std::size_t>(count));
        file = -1;
    }
    return true;
}

} // namespace

std::string defaultSocketPath() { return serviceSocketPath("ostrel.tarnd"); }

/// A thread reads; callers write. The socket stays open, though maybe shut down, until both are out of it.
class [[gnu::visibility("hidden")]] Connection::Implementation {
public:
    Implementation(Handlers handlers, std::string path)
        : handlers_(std::move(handlers)), address_(path), path_(std::move(path)) {
        connect();
    }

    ~Implementation() { disconnect(); }

    void disconnect() {
        std::lock_guard lock(changing_);
        close();
    }

    void reconnect() {
        std::lock_guard lock(changing_);
        close();
        connect();
    }

    void call(const Bytes& envelope, AnswerHandler handler) {
        requireThatItFits(envelope); // before anybody waits for its end
        // A call that is not written ends with the others when the thread sees the end of the connection.
        if (const auto id = expectAnswer(handler))
            write(FrameKind::call, *id, envelope, -1);
        else
            handler(Answer{});
    }

    bool write(FrameKind kind, std::uint64_t callId, const Bytes& body, int file) {
        requireThatItFits(body);
        Data bytes;
        appendFrame(bytes, kind, callId, body);
        std::lock_guard lock(writing_);
        return socket_ && sendAll(socket_.get(), bytes, file);
    }

    bool isConnected() const {
        std::lock_guard lock(state_);
        return connected_;
    }

private:
    /// Takes the handler and gives the id of its call; leaves it alone when there is no connection.
    std::optional<std::uint64_t> expectAnswer(AnswerHandler & handler) {
        std::lock_guard lock(state_);
        if (!connected_)
            return std::nullopt;
        pending_.emplace(nextCallId_, std::move(handler));
        return nextCallId_++;
    }

    void connect() {
        FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        if (!socket || !address_.connect(socket.get()))
            throw std::system_error(errno, std::generic_category(), path_);
        {
            std::scoped_lock lock(writing_, state_);
            socket_ = std::move(socket);
            connected_ = true;
            closing_ = false;
        }
        thread_ = std::thread([this] { run(); });
    }

    void close() {
        assert(thread_.get_id() != std::this_thread::get_id());
        {
            std::lock_guard lock(state_);
            closing_ = true;
        }
        if (!thread_.joinable())
            return;
        ::shutdown(socket_.get(), SHUT_RDWR);
        thread_.join();
        std::lock_guard lock(writing_);
        socket_.reset();
    }

    void run() {
        Receiver receiver;
        FrameReader reader(FrameReader::Sender::service);
        bool lasts = true;
        while (lasts) {
            auto received = receiver.receive(socket_.get(), Receiver::Wait::forFirstByte);
            std::vector<Frame> frames;
            const auto broken = reader.take(received.bytes, std::move(received.files), frames);
            for (const auto& frame : frames)
                deliver(frame);
            lasts = !broken && received.state == Received::State::open;
        }
        end();
    }

    void deliver(const Frame& frame) {
        if (frame.kind == FrameKind::event) {
            if (handlers_.onEvent)
                handlers_.onEvent(frame.body);
            return;
        }
        AnswerHandler handler;
        {
            std::lock_guard lock(state_);
            if (auto found = pending_.extract(frame.callId))
                handler = std::move(found.mapped());
        }
        if (handler)
            handler(answerOf(frame));
    }

    void end() {
        ::shutdown(socket_.get(), SHUT_RDWR);
        std::unordered_map<std::uint64_t, AnswerHandler> ended;
        bool tell = false;
        {
            std::lock_guard lock(state_);
            connected_ = false;
            ended.swap(pending_);
            tell = !closing_;
        }
        for (const auto& [id, handler] : ended)
            handler(Answer{});
        if (tell && handlers_.onLost)
            handlers_.onLost();
    }

    const Handlers handlers_;
    const SocketAddress address_;
    const std::string path_;

    std::mutex changing_; // held while the connection is ended and made; taken before the others
    std::mutex writing_;  // held for one frame; taken before state_
    FileDescriptor socket_;

    mutable std::mutex state_; // guards what follows, up to the next blank line
    bool connected_ = false;
    bool closing_ = false; // by the program: no loss to tell of
    std::uint64_t nextCallId_ = 1;
    std::unordered_map<std::uint64_t, AnswerHandler> pending_;

    std::thread thread_;
};

Connection::Connection(Handlers handlers, std::string socketPath)
    : implementation_(std::make_unique<Implementation>(std::move(handlers), std::move(socketPath))) {}

Connection::~Connection() = default;

void Connection::call(const Bytes& envelope, AnswerHandler handler) {
    implementation_->call(envelope, std::move(handler));
}

bool Connection::send(const Bytes& envelope) {
    return implementation_->write(FrameKind::call, 0, envelope, -1);
}

bool Connection::grant(const std::string& token, const std::string& path, int file) {
    return implementation_->write(FrameKind::extension, 0, encodeExtension({token, path}), file);
}

bool Connection::isConnected() const { return implementation_->isConnected(); }

void Connection::disconnect() { implementation_->disconnect(); }

void Connection::reconnect() { implementation_->reconnect(); }

} // namespace tarn::client
