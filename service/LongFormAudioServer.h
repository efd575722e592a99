#pragma once

#include <memory>
#include <vector>

#include "reply/EventSink.h"
#include "roles/Platform.h"
#include "roles/SerialQueue.h"
#include "roles/ServiceListener.h"
#include "service/LongFormAudioCommand.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// The service: the listener, the one current client connection, the queue of its commands, and the way back
/// to it for events.
///
/// Every change of connection drops the router, and so all objects of the client before; its queue players go
/// at once, also from under work that waits. The new connection is installed behind the commands that were
/// submitted earlier; those that have not begun by then are cancelled. Connection callbacks come on the I/O
/// thread; see each operation for the rest.
class VLLongFormAudioServer final : public ServiceListenerDelegate,
                                    public VLLongFormAudioServerProtocol,
                                    public EventSink,
                                    public std::enable_shared_from_this<VLLongFormAudioServer> {
public:
    /// The process's service, made by the first call. It is never destroyed: other threads may use it until
    /// the process ends.
    static std::shared_ptr<VLLongFormAudioServer> sharedLongFormAudioServer(const Platform& platform);

    /// Does not listen yet.
    explicit VLLongFormAudioServer(const Platform& platform);
    ~VLLongFormAudioServer() override;

    /// Listens, and runs the main run loop on the calling (main) thread; returns only if that does.
    void run();

    /// Always accepts: the newest client is the current one.
    bool listenerShouldAcceptNewConnection(ServiceListener& listener,
                                           const std::shared_ptr<ServiceConnection>& connection) override;

    /// Data that is no envelope costs a log line, and is not answered. The commands are submitted when this
    /// returns.
    void receiveData(std::vector<ReceivedCall> calls) override;

    /// To the client of the moment. Objects of a client do not use it but the sink of their router, so that
    /// what they report never reaches the next client.
    void sendData(const Data& data) override;

    /// Clears the current connection, whichever was lost. On the I/O thread.
    void _connectionWasInvalidated();

    /// Waits for the commands before. Never on the main queue or the command queue.
    void _replaceCurrentConnectionWithConnection(std::shared_ptr<ServiceConnection> connection);

    /// On the main queue, so that commands are submitted in the order of their arrival.
    void _enqueueAudioCommand(VLLongFormAudioCommand command);

    /// Any thread but the guard queue.
    bool _connectionIsValid() const;
    void _setConnectionIsValid(bool isValid);

    /// The current connection; null while there is none. Any thread but the guard queue.
    std::shared_ptr<ServiceConnection> clientConnection() const;

    /// The router of the current connection; null until its first command. On the command queue.
    const std::shared_ptr<VLTorviAudioFilePlayerServer>& audioFilePlayerServer() const {
        return audioFilePlayerServer_;
    }
    const std::shared_ptr<SerialQueue>& commandServiceQueue() const { return commandServiceQueue_; }

private:
    class ClientEvents;

    std::shared_ptr<ServiceConnection> validConnection() const;
    void install(std::shared_ptr<ServiceConnection>& connection);
    void runCommand(VLLongFormAudioCommand& command);
    void routeCommand(const VLLongFormAudioCommand& command);
    void createAudioFilePlayerServer();

    const Platform platform_;
    bool connectionIsValid_ = false; // guard queue only
    std::unique_ptr<ServiceListener> zelConnectionListener_;
    std::shared_ptr<ServiceConnection> clientConnection_; // guard queue only, with the flag
    const std::shared_ptr<SerialQueue> commandServiceQueue_;
    const std::shared_ptr<SerialQueue> connectionValidStateGuardQueue_;
    const std::shared_ptr<SerialQueue> longFormAudioConnectionInvalidated_; // never given work
    std::shared_ptr<VLTorviAudioFilePlayerServer> audioFilePlayerServer_;
    std::shared_ptr<ClientEvents> clientEvents_; // the router's sink; there with it
    LiveObject<"service"> live_;
};

} // namespace tarn
