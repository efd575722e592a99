#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include "ipc/ConnectionSocket.h"
#include "ipc/FrameReader.h"
#include "ipc/Receiver.h"
#include "ipc/TokenTable.h"
#include "roles/ServiceConnection.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// One client. Lives on the I/O thread, apart from remoteObjectProxy(), which any thread may use.
///
/// The listener holds it until its peer goes, and then asks it to report the loss.
class SocketConnection final : public ServiceConnection, private VLLongFormAudioClientProtocol {
public:
    SocketConnection(std::shared_ptr<ConnectionSocket> socket, std::uint64_t key, TokenTable& tokens,
                     FileReceiver& files);

    void setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) override;
    void resume() override;
    void setInterruptionHandler(std::function<void()> handler) override;
    void setInvalidationHandler(std::function<void()> handler) override;
    VLLongFormAudioClientProtocol& remoteObjectProxy() override { return *this; }

    /// Reads and writes what `events` of the poller call for. Once the peer is gone everything that it has
    /// sent is read, up to the first file. False when the connection is lost.
    [[nodiscard]] bool handle(std::uint32_t events, Receiver& receiver);

    /// There may be word of the files that it waits for. False when the connection is lost.
    [[nodiscard]] bool finishArrival();

    /// Ends the connection with one line in the log.
    void interrupt(std::string_view reason);

    /// This connection is not the service's current one any more, for the reason that `news` gives. A client
    /// that has asked for news is told, once for each reason, and no more after `takenOver`.
    void displace(FrameKind news);

    /// Closes what is lost and runs the handler that it calls for.
    void reportLoss(Receiver& receiver);

    /// Closes without a word.
    void close(Receiver& receiver);

    std::size_t unfinishedBytes() const { return reader_.unfinishedBytes(); }
    int socket() const { return socket_->socket(); }

private:
    class Call;
    enum class Loss { none, interruption, invalidation };

    void receiveData(const Data& data) override;
    void handleHangUp(Receiver& receiver);
    void read(Receiver& receiver);
    void beginArrival(std::span<const std::uint8_t> bytes);
    void take(std::span<const std::uint8_t> bytes, std::vector<ReceivedFile> files);
    void deliver(std::vector<Frame> frames);
    void takeExtension(Frame frame);
    void beginNews(std::uint64_t callId);

    const std::shared_ptr<ConnectionSocket> socket_;
    const std::uint64_t key_;
    TokenTable& tokens_;
    FileReceiver& files_;
    FrameReader reader_{FrameReader::Sender::client};
    std::shared_ptr<VLLongFormAudioServerProtocol> exportedObject_;
    std::function<void()> interruptionHandler_;
    std::function<void()> invalidationHandler_;
    bool resumed_ = false;
    bool wantsNews_ = false;
    std::optional<FrameKind> displaced_;
    Loss loss_ = Loss::none;

    // While files are on their way nothing else is read.
    std::unique_ptr<FileReceiver::Arrival> arrival_;
    Data arrivingBytes_; // that the files belong to
    LiveObject<"connection"> live_;
};

} // namespace tarn
