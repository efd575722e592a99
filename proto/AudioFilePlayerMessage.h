#pragma once

#include <memory>
#include <string_view>

#include "proto/AudioFilePlayerAsset.h"
#include "proto/AudioFilePlayerItem.h"
#include "proto/AudioFileQueuePlayer.h"
#include "proto/Message.h"

namespace tarn {

/// A command or event about one kind of object: the field that is set names it.
class VLProtoAudioFilePlayerMessage final : public Message<VLProtoAudioFilePlayerMessage> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerMessage";

    const std::shared_ptr<VLProtoAudioFilePlayerAsset>& asset() const { return asset_; }
    void setAsset(std::shared_ptr<VLProtoAudioFilePlayerAsset> message) { asset_ = std::move(message); }
    bool hasAsset() const { return asset_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerItem>& playerItem() const { return playerItem_; }
    void setPlayerItem(std::shared_ptr<VLProtoAudioFilePlayerItem> message) {
        playerItem_ = std::move(message);
    }
    bool hasPlayerItem() const { return playerItem_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFileQueuePlayer>& queuePlayer() const { return queuePlayer_; }
    void setQueuePlayer(std::shared_ptr<VLProtoAudioFileQueuePlayer> message) {
        queuePlayer_ = std::move(message);
    }
    bool hasQueuePlayer() const { return queuePlayer_ != nullptr; }

    static constexpr auto fields() {
        return std::tuple{optional(1, "asset", &Self::asset_), optional(2, "playerItem", &Self::playerItem_),
                          optional(3, "queuePlayer", &Self::queuePlayer_)};
    }

private:
    std::shared_ptr<VLProtoAudioFilePlayerAsset> asset_;
    std::shared_ptr<VLProtoAudioFilePlayerItem> playerItem_;
    std::shared_ptr<VLProtoAudioFileQueuePlayer> queuePlayer_;
};

extern template class Message<VLProtoAudioFilePlayerMessage>;

} // namespace tarn
