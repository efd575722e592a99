#pragma once

#include <memory>

#include "objects/AssetManager.h"
#include "objects/PlayerItemManager.h"
#include "queueplayer/QueuePlayerManager.h"
#include "roles/Platform.h"
#include "service/AudioFilePlayerServer.h"
#include "tests/support/ClientCommands.h"
#include "tests/support/Transcript.h"

namespace tarn {

/// One client as the router knows it, all of its managers made, with the transcript of what the client sees.
///
/// Commands may be sent from one thread at a time. When it goes, its objects go with the last command.
class MirroredClient final {
public:
    explicit MirroredClient(const Platform& platform);

    /// Hands the command to its manager's queue; its answer begins with the name of the command.
    void send(const commands::Command& command) { send(command, replyTo(*command)); }
    void send(const commands::Command& command, Reply reply);

    Transcript& transcript() { return *transcript_; }

    /// Runs asset and queue-player commands.
    SerialQueue& playerQueue() { return *router_->queuePlayerManagerQueue(); }
    SerialQueue& itemQueue() { return *router_->playerItemManagerQueue(); }

private:
    Reply replyTo(const VLProtoAudioFilePlayerMessage& command);

    const std::shared_ptr<Transcript> transcript_ = std::make_shared<Transcript>();
    const std::shared_ptr<VLTorviAudioFilePlayerServer> router_;

public:
    const std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assets;
    const std::shared_ptr<VLTorviAudioFilePlayerItemManager> items;
    const std::shared_ptr<VLTorviAudioFilePlayerQueuePlayerManager> players;
};

} // namespace tarn
