#pragma once

#include <memory>
#include <string_view>

#include "proto/AudioFilePlayerItemSetCurrentTime.h"
#include "proto/AudioFilePlayerStatus.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/Message.h"
#include "proto/ObjectMessage.h"

namespace tarn {

/// A command or event about a player item: the field that is set names it. `setStatus` and those that begin
/// with `notify` are events, which the service sends.
class VLProtoAudioFilePlayerItem final : public Message<VLProtoAudioFilePlayerItem> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerItem";

    const std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier>& upsertWithAsset() const {
        return upsertWithAsset_;
    }
    void setUpsertWithAsset(std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> message) {
        upsertWithAsset_ = std::move(message);
    }
    bool hasUpsertWithAsset() const { return upsertWithAsset_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& destroy() const { return destroy_; }
    void setDestroy(std::shared_ptr<VLProtoObjectMessage> message) { destroy_ = std::move(message); }
    bool hasDestroy() const { return destroy_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerStatus>& setStatus() const { return setStatus_; }
    void setSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> message) {
        setStatus_ = std::move(message);
    }
    bool hasSetStatus() const { return setStatus_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& getCurrentTime() const { return getCurrentTime_; }
    void setGetCurrentTime(std::shared_ptr<VLProtoObjectMessage> message) {
        getCurrentTime_ = std::move(message);
    }
    bool hasGetCurrentTime() const { return getCurrentTime_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& notifyTimeJumped() const { return notifyTimeJumped_; }
    void setNotifyTimeJumped(std::shared_ptr<VLProtoObjectMessage> message) {
        notifyTimeJumped_ = std::move(message);
    }
    bool hasNotifyTimeJumped() const { return notifyTimeJumped_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& notifyDidPlayToEndTime() const {
        return notifyDidPlayToEndTime_;
    }
    void setNotifyDidPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> message) {
        notifyDidPlayToEndTime_ = std::move(message);
    }
    bool hasNotifyDidPlayToEndTime() const { return notifyDidPlayToEndTime_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& notifyFailedToPlayToEndTime() const {
        return notifyFailedToPlayToEndTime_;
    }
    void setNotifyFailedToPlayToEndTime(std::shared_ptr<VLProtoObjectMessage> message) {
        notifyFailedToPlayToEndTime_ = std::move(message);
    }
    bool hasNotifyFailedToPlayToEndTime() const { return notifyFailedToPlayToEndTime_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerItemSetCurrentTime>& setItemCurrentTime() const {
        return setItemCurrentTime_;
    }
    void setSetItemCurrentTime(std::shared_ptr<VLProtoAudioFilePlayerItemSetCurrentTime> message) {
        setItemCurrentTime_ = std::move(message);
    }
    bool hasSetItemCurrentTime() const { return setItemCurrentTime_ != nullptr; }

    static constexpr auto fields() {
        return std::tuple{optional(1, "upsertWithAsset", &Self::upsertWithAsset_),
                          optional(2, "destroy", &Self::destroy_),
                          optional(3, "setStatus", &Self::setStatus_),
                          optional(4, "getCurrentTime", &Self::getCurrentTime_),
                          optional(5, "notifyTimeJumped", &Self::notifyTimeJumped_),
                          optional(6, "notifyDidPlayToEndTime", &Self::notifyDidPlayToEndTime_),
                          optional(7, "notifyFailedToPlayToEndTime", &Self::notifyFailedToPlayToEndTime_),
                          optional(8, "setItemCurrentTime", &Self::setItemCurrentTime_)};
    }

private:
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> upsertWithAsset_;
    std::shared_ptr<VLProtoObjectMessage> destroy_;
    std::shared_ptr<VLProtoAudioFilePlayerStatus> setStatus_;
    std::shared_ptr<VLProtoObjectMessage> getCurrentTime_;
    std::shared_ptr<VLProtoObjectMessage> notifyTimeJumped_;
    std::shared_ptr<VLProtoObjectMessage> notifyDidPlayToEndTime_;
    std::shared_ptr<VLProtoObjectMessage> notifyFailedToPlayToEndTime_;
    std::shared_ptr<VLProtoAudioFilePlayerItemSetCurrentTime> setItemCurrentTime_;
};

extern template class Message<VLProtoAudioFilePlayerItem>;

} // namespace tarn
