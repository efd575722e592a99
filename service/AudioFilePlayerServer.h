#pragma once

#include <memory>

#include "reply/EventSink.h"
#include "roles/Platform.h"
#include "roles/Reply.h"
#include "roles/SerialQueue.h"
#include "threads/LiveObjects.h"
#include "threads/MutexProtected.h"

namespace tarn {

class ObjectAccount;
class VLProtoAudioFilePlayerMessage;
class VLTorviAudioFilePlayerAssetManager;
class VLTorviAudioFilePlayerItemManager;
class VLTorviAudioFilePlayerQueuePlayerManager;

/// The router of one client connection: finds the manager for each message, by the kind of object that it
/// is about, and hands the message over on the manager's queue.
///
/// Owns the managers, each made by the first message of its kind and then linked to those it works with.
/// Work that was handed over keeps the router until it has run. Any thread may call, except where stated.
class VLTorviAudioFilePlayerServer final : public std::enable_shared_from_this<VLTorviAudioFilePlayerServer> {
public:
    /// Makes the queues, and no manager yet.
    explicit VLTorviAudioFilePlayerServer(const Platform& platform);
    ~VLTorviAudioFilePlayerServer();

    /// On the command queue. Returns as soon as the work is submitted. A message without a part that can be
    /// routed, or none at all (null), is dropped, and its reply goes unanswered.
    void handleMessage(std::shared_ptr<VLProtoAudioFilePlayerMessage> message, Reply reply);

    /// The client is gone: its queue players go at once, though work that waits may keep the router and its
    /// other objects for a while. Once.
    void close();

    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManagerCreateIfNeeded();
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManagerCreateIfNeeded();
    std::shared_ptr<VLTorviAudioFilePlayerQueuePlayerManager> queuePlayerManagerCreateIfNeeded();

    /// The service, for the managers that are made later; null once it is gone.
    std::shared_ptr<EventSink> audioServer() const;
    void setAudioServer(std::weak_ptr<EventSink> audioServer);

    /// The same, also for the managers that are there.
    void setAppConnction(std::weak_ptr<EventSink> audioServer);

    // Queues are set before the first message only.
    const std::shared_ptr<SerialQueue>& assetManagerQueue() const { return assetManagerQueue_; }
    void setAssetManagerQueue(std::shared_ptr<SerialQueue> queue) { assetManagerQueue_ = std::move(queue); }
    const std::shared_ptr<SerialQueue>& playerItemManagerQueue() const { return playerItemManagerQueue_; }
    void setPlayerItemManagerQueue(std::shared_ptr<SerialQueue> queue) {
        playerItemManagerQueue_ = std::move(queue);
    }
    const std::shared_ptr<SerialQueue>& queuePlayerManagerQueue() const { return queuePlayerManagerQueue_; }
    void setQueuePlayerManagerQueue(std::shared_ptr<SerialQueue> queue) {
        queuePlayerManagerQueue_ = std::move(queue);
    }

private:
    /// Filled from both manager queues, so slots and links change together under one lock. The managers' own
    /// locks come after it.
    struct Managers {
        std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assetManager;
        std::shared_ptr<VLTorviAudioFilePlayerItemManager> playerItemManager;
        std::shared_ptr<VLTorviAudioFilePlayerQueuePlayerManager> queuePlayerManager;
        std::weak_ptr<EventSink> audioServer;
    };

    template <auto managerCreateIfNeeded, auto part>
    void submit(SerialQueue& queue, std::shared_ptr<VLProtoAudioFilePlayerMessage> message, Reply reply);

    template <class Manager>
    std::shared_ptr<Manager> createIfNeeded(std::shared_ptr<Manager> Managers::*slot);
    static void _updateManagerAssociations(Managers& managers);

    const Platform platform_;
    const std::shared_ptr<ObjectAccount> account_; // of all managers
    MutexProtected<Managers> managers_;
    std::shared_ptr<SerialQueue> assetManagerQueue_; // never given work
    std::shared_ptr<SerialQueue> playerItemManagerQueue_;
    std::shared_ptr<SerialQueue> queuePlayerManagerQueue_; // asset messages too
    LiveObject<"router"> live_;
};

} // namespace tarn
