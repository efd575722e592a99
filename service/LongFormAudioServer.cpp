#include "service/LongFormAudioServer.h"

#include <cassert>
#include <exception>
#include <optional>
#include <string>
#include <utility>

#include "log/SystemLog.h"
#include "proto/VelmoMessage.h"
#include "reply/Error.h"
#include "roles/Localization.h"
#include "roles/NowPlayingService.h"
#include "service/AudioFilePlayerServer.h"

namespace tarn {

namespace {

/// Null, with a log line, for data that is no envelope.
std::shared_ptr<VLProtoVelmoMessage> envelopeFromData(const Data& data) {
    auto envelope = VLProtoVelmoMessage::fromDataWithoutPlist(data);
    if (envelope == nullptr)
        SystemLog::error("-[VLLongFormAudioServer receiveData:callback:]", 97,
                         "%{public}s:%d: failed to initialize protoMessage, data=%p, len=%d", data.data(),
                         data.size());
    return envelope;
}

} // namespace

/// The sink of one router's objects. They hold it, and may report after the router has gone: that reaches
/// their own client or nobody.
class VLLongFormAudioServer::ClientEvents final : public EventSink {
public:
    ClientEvents(std::weak_ptr<const VLLongFormAudioServer> service,
                 std::weak_ptr<ServiceConnection> connection)
        : service_(std::move(service)), connection_(std::move(connection)) {}

    void sendData(const Data& data) override {
        const auto service = service_.lock();
        const auto current = service ? service->validConnection() : nullptr;
        if (current != nullptr && current == connection_.lock())
            current->remoteObjectProxy().receiveData(data);
    }

private:
    const std::weak_ptr<const VLLongFormAudioServer> service_;
    const std::weak_ptr<ServiceConnection> connection_;
};

std::shared_ptr<VLLongFormAudioServer>
VLLongFormAudioServer::sharedLongFormAudioServer(const Platform& platform) {
    static const auto& shared =
        *new std::shared_ptr<VLLongFormAudioServer>(std::make_shared<VLLongFormAudioServer>(platform));
    return shared;
}

VLLongFormAudioServer::VLLongFormAudioServer(const Platform& platform)
    : platform_(platform),
      zelConnectionListener_(platform.listeners.createWithServiceName("ostrel.tarnd")),
      commandServiceQueue_(platform.queues.create("ostrel.tarnd.audioCommands")),
      connectionValidStateGuardQueue_(platform.queues.create("ostrel.tarnd.connectionValidStateGuardQueue")),
      longFormAudioConnectionInvalidated_(platform.queues.create("ostrel.tarnd.connectionInvalidated")) {
    zelConnectionListener_->setDelegate(this);
}

VLLongFormAudioServer::~VLLongFormAudioServer() = default;

void VLLongFormAudioServer::run() {
    zelConnectionListener_->resume();
    platform_.queues.runMainLoop();
}

bool VLLongFormAudioServer::listenerShouldAcceptNewConnection(
    ServiceListener&, const std::shared_ptr<ServiceConnection>& connection) {
    auto whenLost = [self = shared_from_this()] { self->_connectionWasInvalidated(); };
    connection->setExportedObject(shared_from_this());
    connection->resume();
    connection->setInterruptionHandler(whenLost);
    connection->setInvalidationHandler(whenLost);
    _replaceCurrentConnectionWithConnection(connection);
    return true;
}

void VLLongFormAudioServer::_connectionWasInvalidated() {
    _replaceCurrentConnectionWithConnection(nullptr);
    platform_.nowPlaying.setParentApplication(platform_.nowPlaying.localOrigin(), std::nullopt);
}

void VLLongFormAudioServer::_replaceCurrentConnectionWithConnection(
    std::shared_ptr<ServiceConnection> connection) {
    assert(!commandServiceQueue_->isCurrent() && !platform_.queues.main().isCurrent());
    _setConnectionIsValid(false); // cancels the commands that have not begun
    commandServiceQueue_->sync([&] {
        clientEvents_ = nullptr;
        if (auto router = std::exchange(audioFilePlayerServer_, nullptr))
            router->close();
        install(connection);
    });
    // The connection that was displaced goes here, on none of the queues.
}

/// Exchanges the current connection for `connection`.
void VLLongFormAudioServer::install(std::shared_ptr<ServiceConnection>& connection) {
    connectionValidStateGuardQueue_->sync([&] {
        clientConnection_.swap(connection);
        connectionIsValid_ = clientConnection_ != nullptr;
    });
}

void VLLongFormAudioServer::receiveData(std::vector<ReceivedCall> calls) {
    std::vector<std::pair<std::shared_ptr<VLProtoVelmoMessage>, Reply>> arrived;
    arrived.reserve(calls.size());
    for (auto& call : calls)
        if (auto envelope = envelopeFromData(call.data))
            arrived.emplace_back(std::move(envelope), std::move(call.reply));
    if (arrived.empty())
        return;
    platform_.queues.main().sync([&] {
        for (auto& [envelope, reply] : arrived)
            _enqueueAudioCommand({envelope->audioFilePlayerMessage(), std::move(reply)});
    });
}

void VLLongFormAudioServer::sendData(const Data& data) {
    if (auto connection = validConnection())
        connection->remoteObjectProxy().receiveData(data);
}

/// Flag and connection in one step, so that a connection that is being displaced is not taken.
std::shared_ptr<ServiceConnection> VLLongFormAudioServer::validConnection() const {
    std::shared_ptr<ServiceConnection> connection;
    connectionValidStateGuardQueue_->sync([&] {
        if (connectionIsValid_)
            connection = clientConnection_;
    });
    return connection;
}

std::shared_ptr<ServiceConnection> VLLongFormAudioServer::clientConnection() const {
    std::shared_ptr<ServiceConnection> connection;
    connectionValidStateGuardQueue_->sync([&] { connection = clientConnection_; });
    return connection;
}

bool VLLongFormAudioServer::_connectionIsValid() const {
    bool isValid = false;
    connectionValidStateGuardQueue_->sync([&] { isValid = connectionIsValid_; });
    return isValid;
}

void VLLongFormAudioServer::_setConnectionIsValid(bool isValid) {
    connectionValidStateGuardQueue_->sync([&] { connectionIsValid_ = isValid; });
}

void VLLongFormAudioServer::_enqueueAudioCommand(VLLongFormAudioCommand command) {
    assert(platform_.queues.main().isCurrent());
    commandServiceQueue_->async(
        [self = shared_from_this(), command = std::move(command)]() mutable { self->runCommand(command); });
}

void VLLongFormAudioServer::runCommand(VLLongFormAudioCommand& command) {
    assert(commandServiceQueue_->isCurrent());
    if (!_connectionIsValid()) {
        command.cancelWithError(VLError::errorWithCode(platform_.localization, VLError::connectionLost));
        return;
    }
    std::optional<std::string> reason;
    try {
        routeCommand(command);
    } catch (const std::exception& exception) {
        reason = exception.what();
    }
    if (reason)
        command.cancelWithError(
            VLError::errorWithCode(platform_.localization, VLError::audioPlayback, reason));
}

void VLLongFormAudioServer::routeCommand(const VLLongFormAudioCommand& command) {
    if (audioFilePlayerServer_ == nullptr)
        platform_.queues.main().sync([this] { createAudioFilePlayerServer(); });
    command.runOnAudioPlayer(*audioFilePlayerServer_);
}

/// On the main queue, while the command queue waits.
void VLLongFormAudioServer::createAudioFilePlayerServer() {
    assert(platform_.queues.main().isCurrent());
    audioFilePlayerServer_ = std::make_shared<VLTorviAudioFilePlayerServer>(platform_);
    clientEvents_ = std::make_shared<ClientEvents>(weak_from_this(), clientConnection());
    audioFilePlayerServer_->setAudioServer(clientEvents_);
}

} // namespace tarn
