#include "ipc/SocketConnection.h"

#include <malloc.h>

#include <algorithm>
#include <utility>

#include "ipc/TransportMessages.h"
#include "log/SystemLog.h"
#include "wire/ProtoWriter.h"

namespace tarn {

namespace {

constexpr std::size_t longFrame = 65'536; // no client of good will comes near

} // namespace

/// One call on this connection. It is unfinished until it goes, and when it goes without an answer the client
/// is told so.
class SocketConnection::Call final : public Reply::Call {
public:
    /// `id` 0: the client wants no answer, so none is sent. `bytes` is the length of the call.
    Call(std::shared_ptr<ConnectionSocket> socket, std::uint64_t id, std::size_t bytes)
        : socket_(std::move(socket)), id_(id), bytes_(bytes) {
        socket_->beginCall(bytes_);
    }

    ~Call() override {
        if (id_ != 0 && !isAnswered_)
            socket_->send(FrameKind::released, id_, {});
        socket_->finishCall(bytes_);
    }

    void answer(std::optional<Data> data, const std::optional<Error>& error) override {
        if (id_ == 0 || isAnswered_)
            return;
        ProtoWriter reply;
        writeReply(std::move(data), error, reply);
        if (reply.bytes().size() > FrameHeader::largestBody) {
            SystemLog::error(__func__, __LINE__, "%{public}s:%d: dropped an answer of %d bytes: too long",
                             reply.bytes().size());
            return;
        }
        isAnswered_ = true;
        socket_->send(FrameKind::reply, id_, reply.bytes());
    }

private:
    const std::shared_ptr<ConnectionSocket> socket_;
    const std::uint64_t id_;
    const std::size_t bytes_;
    bool isAnswered_ = false;
};

SocketConnection::SocketConnection(std::shared_ptr<ConnectionSocket> socket, std::uint64_t key,
                                   TokenTable& tokens, FileReceiver& files)
    : socket_(std::move(socket)), key_(key), tokens_(tokens), files_(files) {}

void SocketConnection::setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) {
    exportedObject_ = std::move(object);
}

void SocketConnection::resume() {
    resumed_ = true;
    socket_->startReading();
}

void SocketConnection::setInterruptionHandler(std::function<void()> handler) {
    interruptionHandler_ = std::move(handler);
}

void SocketConnection::setInvalidationHandler(std::function<void()> handler) {
    invalidationHandler_ = std::move(handler);
}

void SocketConnection::receiveData(const Data& data) {
    if (data.size() > FrameHeader::largestBody) {
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: dropped an event of %d bytes: too long",
                         data.size());
        return;
    }
    socket_->send(FrameKind::event, 0, data);
}

bool SocketConnection::handle(std::uint32_t events, Receiver& receiver) {
    if ((events & EPOLLOUT) != 0)
        socket_->flush();
    if ((events & (EPOLLRDHUP | EPOLLHUP | EPOLLERR)) != 0)
        handleHangUp(receiver);
    else if ((events & EPOLLIN) != 0)
        read(receiver);
    socket_->limitReading();
    return loss_ == Loss::none;
}

void SocketConnection::handleHangUp(Receiver& receiver) {
    if (const auto failure = socket_->failure(); !failure.empty())
        return interrupt(failure);
    if (!resumed_ || arrival_)
        loss_ = Loss::invalidation;
    while (loss_ == Loss::none) {
        read(receiver);
        if (arrival_) // of one that is gone: nobody waits for its files
            loss_ = Loss::invalidation;
    }
}

void SocketConnection::read(Receiver& receiver) {
    const Received received = receiver.receiveUpToFiles(socket_->socket());
    if (received.state == Received::State::withFiles)
        return beginArrival(received.bytes);
    if (received.state == Received::State::ended)
        loss_ = Loss::invalidation;
    if (!received.bytes.empty())
        take(received.bytes, {});
}

void SocketConnection::beginArrival(std::span<const std::uint8_t> bytes) {
    arrival_ = files_.receive(socket_->socket(), bytes.size());
    if (!arrival_ || !socket_->beginArrival(arrival_->descriptor()))
        return interrupt("its files could not be taken");
    arrivingBytes_.assign(bytes.begin(), bytes.end());
}

bool SocketConnection::finishArrival() {
    auto arrived = arrival_ ? arrival_->take() : std::nullopt;
    if (!arrived)
        return true;
    socket_->endArrival(arrival_->descriptor());
    arrival_.reset();
    if (!arrived->isTaken)
        interrupt("its files could not be taken");
    else
        take(std::exchange(arrivingBytes_, {}), std::move(arrived->files));
    socket_->limitReading();
    return loss_ == Loss::none;
}

void SocketConnection::take(std::span<const std::uint8_t> bytes, std::vector<ReceivedFile> files) {
    std::vector<Frame> frames;
    const auto broken = reader_.take(bytes, std::move(files), frames);
    deliver(std::move(frames));
    if (broken)
        interrupt(*broken);
}

void SocketConnection::deliver(std::vector<Frame> frames) {
    std::vector<ReceivedCall> calls;
    std::size_t longest = 0;
    for (auto& frame : frames) {
        longest = std::max(longest, frame.body.size());
        if (frame.kind == FrameKind::extension) {
            takeExtension(std::move(frame));
            if (loss_ == Loss::interruption)
                break; // what came behind it is not looked at
            continue;
        }
        if (std::ranges::equal(frame.body, askForNews)) {
            beginNews(frame.callId);
            continue;
        }
        auto call = std::make_shared<Call>(socket_, frame.callId, frame.body.size());
        calls.push_back({std::move(frame.body), Reply(std::move(call))});
    }
    if (!calls.empty() && exportedObject_)
        exportedObject_->receiveData(std::move(calls));
    if (longest >= longFrame)
        ::malloc_trim(
            0); // the heap of a thread would keep up to 64 MiB of what such a frame was decoded into
}

void SocketConnection::takeExtension(Frame frame) {
    const auto extension = decodeExtension(frame.body);
    if (!extension)
        return interrupt("an extension cannot be decoded");
    const auto refusal = tokens_.grant(key_, extension->token, extension->path, std::move(frame.file));
    if (!refusal.empty())
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: refused a file of client %d: %{public}s", key_,
                         refusal);
}

/// Answered with neither data nor error. A service that knows no news releases the call instead.
void SocketConnection::beginNews(std::uint64_t callId) {
    wantsNews_ = true;
    if (callId != 0)
        socket_->send(FrameKind::reply, callId, {});
    if (displaced_)
        socket_->send(*displaced_, 0, {});
}

void SocketConnection::displace(FrameKind news) {
    if (displaced_ == FrameKind::takenOver || displaced_ == news)
        return;
    displaced_ = news;
    if (wantsNews_)
        socket_->send(news, 0, {});
}

void SocketConnection::interrupt(std::string_view reason) {
    if (std::exchange(loss_, Loss::interruption) != Loss::interruption)
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: ended the connection of client %d: %{public}s",
                         key_, reason);
}

void SocketConnection::reportLoss(Receiver& receiver) {
    const auto handler = loss_ == Loss::interruption ? interruptionHandler_ : invalidationHandler_;
    close(receiver);
    if (handler)
        handler();
}

void SocketConnection::close(Receiver& receiver) {
    if (receiver.drain(socket_->socket()))
        files_.drop(socket_->socket());
    if (arrival_)
        socket_->endArrival(arrival_->descriptor());
    arrival_.reset();
    socket_->close();
    tokens_.forget(key_);
    // They hold the service, which may hold this connection.
    exportedObject_.reset();
    interruptionHandler_ = nullptr;
    invalidationHandler_ = nullptr;
}

} // namespace tarn
