#pragma once

#include <memory>

#include "assets/AssetManager.h"
#include "assets/PlayerItemManager.h"
#include "platform/Platform.h"
#include "platform/SerialQueue.h"
#include "queueplayer/QueuePlayerManager.h"
#include "tests/support/ClientCommands.h"
#include "tests/support/Transcript.h"

namespace tarn {

/// One client as the managers know it: three managers that are linked, each on its queue, and the transcript
/// of what the client sees.
///
/// Commands may be sent from one thread at a time. Destroying it waits until the queues have nothing to do.
class MirroredClient final {
public:
    explicit MirroredClient(const Platform& platform);
    ~MirroredClient();
    MirroredClient(const MirroredClient&) = delete;
    MirroredClient& operator=(const MirroredClient&) = delete;

    /// Hands the command to its manager's queue; its answer begins with the name of the command.
    void send(const commands::Command& command);

    Transcript& transcript() { return *transcript_; }

    const std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assets;
    const std::shared_ptr<VLTorviAudioFilePlayerItemManager> items;
    const std::shared_ptr<VLTorviAudioFilePlayerQueuePlayerManager> players;

    /// Runs asset and queue-player commands.
    const std::shared_ptr<SerialQueue> playerQueue;
    const std::shared_ptr<SerialQueue> itemQueue;

private:
    const std::shared_ptr<Transcript> transcript_ = std::make_shared<Transcript>();
};

} // namespace tarn
