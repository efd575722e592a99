#include "service/AudioFilePlayerServer.h"

#include <utility>

#include "objects/AssetManager.h"
#include "objects/PlayerItemManager.h"
#include "proto/AudioFilePlayerMessage.h"
#include "queueplayer/QueuePlayerManager.h"

namespace tarn {

VLTorviAudioFilePlayerServer::VLTorviAudioFilePlayerServer(const Platform& platform)
    : platform_(platform),
      account_(std::make_shared<ObjectAccount>()),
      assetManagerQueue_(platform.queues.create("ostrel.tarnd.assetManagerQueue")),
      playerItemManagerQueue_(platform.queues.create("ostrel.tarnd.playterItemManagerQueue")),
      queuePlayerManagerQueue_(platform.queues.create("ostrel.tarnd.queuePlayterManagerQueue")) {}

VLTorviAudioFilePlayerServer::~VLTorviAudioFilePlayerServer() = default;

void VLTorviAudioFilePlayerServer::handleMessage(std::shared_ptr<VLProtoAudioFilePlayerMessage> message,
                                                 Reply reply) {
    using Router = VLTorviAudioFilePlayerServer;
    using Message = VLProtoAudioFilePlayerMessage;
    if (message == nullptr)
        return;
    if (message->hasQueuePlayer())
        submit<&Router::queuePlayerManagerCreateIfNeeded, &Message::queuePlayer>(
            *queuePlayerManagerQueue_, std::move(message), std::move(reply));
    else if (message->hasPlayerItem())
        submit<&Router::playerItemManagerCreateIfNeeded, &Message::playerItem>(
            *playerItemManagerQueue_, std::move(message), std::move(reply));
    else if (message->hasAsset())
        submit<&Router::assetManagerCreateIfNeeded, &Message::asset>(*queuePlayerManagerQueue_,
                                                                     std::move(message), std::move(reply));
}

/// The work holds the router, the message and the reply until it has run.
template <auto managerCreateIfNeeded, auto part>
void VLTorviAudioFilePlayerServer::submit(SerialQueue& queue,
                                          std::shared_ptr<VLProtoAudioFilePlayerMessage> message,
                                          Reply reply) {
    queue.async(
        [self = shared_from_this(), message = std::move(message), reply = std::move(reply)]() mutable {
            ((*self).*managerCreateIfNeeded)()->handleMessage(((*message).*part)(), std::move(reply));
        });
}

void VLTorviAudioFilePlayerServer::close() {
    // Made if need be: work that has not begun would make one that is not closed.
    queuePlayerManagerCreateIfNeeded()->close();
}

std::shared_ptr<VLTorviAudioFilePlayerAssetManager>
VLTorviAudioFilePlayerServer::assetManagerCreateIfNeeded() {
    return createIfNeeded(&Managers::assetManager);
}

std::shared_ptr<VLTorviAudioFilePlayerItemManager>
VLTorviAudioFilePlayerServer::playerItemManagerCreateIfNeeded() {
    return createIfNeeded(&Managers::playerItemManager);
}

std::shared_ptr<VLTorviAudioFilePlayerQueuePlayerManager>
VLTorviAudioFilePlayerServer::queuePlayerManagerCreateIfNeeded() {
    return createIfNeeded(&Managers::queuePlayerManager);
}

template <class Manager>
std::shared_ptr<Manager>
VLTorviAudioFilePlayerServer::createIfNeeded(std::shared_ptr<Manager> Managers::*slot) {
    return managers_.withLocked([&](Managers& managers) {
        auto& manager = managers.*slot;
        if (manager == nullptr) {
            manager = std::make_shared<Manager>(platform_);
            manager->setAudioServer(managers.audioServer);
            manager->setAccount(account_);
            _updateManagerAssociations(managers);
        }
        return manager;
    });
}

void VLTorviAudioFilePlayerServer::_updateManagerAssociations(Managers& managers) {
    if (managers.playerItemManager != nullptr)
        managers.playerItemManager->setAssetManager(managers.assetManager);
    if (managers.queuePlayerManager != nullptr) {
        managers.queuePlayerManager->setAssetManager(managers.assetManager);
        managers.queuePlayerManager->setPlayerItemManager(managers.playerItemManager);
    }
}

std::shared_ptr<EventSink> VLTorviAudioFilePlayerServer::audioServer() const {
    return managers_.withLocked([](const Managers& managers) { return managers.audioServer.lock(); });
}

void VLTorviAudioFilePlayerServer::setAudioServer(std::weak_ptr<EventSink> audioServer) {
    managers_.withLocked([&](Managers& managers) { managers.audioServer = std::move(audioServer); });
}

void VLTorviAudioFilePlayerServer::setAppConnction(std::weak_ptr<EventSink> audioServer) {
    managers_.withLocked([&](Managers& managers) {
        managers.audioServer = audioServer;
        if (managers.assetManager != nullptr)
            managers.assetManager->setAudioServer(audioServer);
        if (managers.playerItemManager != nullptr)
            managers.playerItemManager->setAudioServer(audioServer);
        if (managers.queuePlayerManager != nullptr)
            managers.queuePlayerManager->setAudioServer(audioServer);
    });
}

} // namespace tarn
