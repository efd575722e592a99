#pragma once

#include <memory>
#include <string_view>

#include "proto/AudioFilePlayerStatus.h"
#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"
#include "proto/AudioFileQueuePlayerSetItems.h"
#include "proto/AudioFileQueuePlayerSetRate.h"
#include "proto/Message.h"
#include "proto/ObjectMessage.h"

namespace tarn {

/// A command or event about a queue player: the field that is set names it. `setStatus` and `setCurrentItem`
/// are events, which the service sends; `setRate` is both a command and an event.
class VLProtoAudioFileQueuePlayer final : public Message<VLProtoAudioFileQueuePlayer> {
public:
    static constexpr std::string_view className = "VLProtoAudioFileQueuePlayer";

    const std::shared_ptr<VLProtoAudioFileQueuePlayerSetItems>& upsertWithItems() const {
        return upsertWithItems_;
    }
    void setUpsertWithItems(std::shared_ptr<VLProtoAudioFileQueuePlayerSetItems> message) {
        upsertWithItems_ = std::move(message);
    }
    bool hasUpsertWithItems() const { return upsertWithItems_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& destroy() const { return destroy_; }
    void setDestroy(std::shared_ptr<VLProtoObjectMessage> message) { destroy_ = std::move(message); }
    bool hasDestroy() const { return destroy_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFileQueuePlayerSetRate>& setRate() const { return setRate_; }
    void setSetRate(std::shared_ptr<VLProtoAudioFileQueuePlayerSetRate> message) {
        setRate_ = std::move(message);
    }
    bool hasSetRate() const { return setRate_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier>& replaceCurrentItem() const {
        return replaceCurrentItem_;
    }
    void setReplaceCurrentItem(std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> message) {
        replaceCurrentItem_ = std::move(message);
    }
    bool hasReplaceCurrentItem() const { return replaceCurrentItem_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerStatus>& setStatus() const { return setStatus_; }
    void setSetStatus(std::shared_ptr<VLProtoAudioFilePlayerStatus> message) {
        setStatus_ = std::move(message);
    }
    bool hasSetStatus() const { return setStatus_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& advanceToNextItem() const { return advanceToNextItem_; }
    void setAdvanceToNextItem(std::shared_ptr<VLProtoObjectMessage> message) {
        advanceToNextItem_ = std::move(message);
    }
    bool hasAdvanceToNextItem() const { return advanceToNextItem_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier>& appendItem() const {
        return appendItem_;
    }
    void setAppendItem(std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> message) {
        appendItem_ = std::move(message);
    }
    bool hasAppendItem() const { return appendItem_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier>& removeItem() const {
        return removeItem_;
    }
    void setRemoveItem(std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> message) {
        removeItem_ = std::move(message);
    }
    bool hasRemoveItem() const { return removeItem_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& removeAllItems() const { return removeAllItems_; }
    void setRemoveAllItems(std::shared_ptr<VLProtoObjectMessage> message) {
        removeAllItems_ = std::move(message);
    }
    bool hasRemoveAllItems() const { return removeAllItems_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier>& setCurrentItem() const {
        return setCurrentItem_;
    }
    void setSetCurrentItem(std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> message) {
        setCurrentItem_ = std::move(message);
    }
    bool hasSetCurrentItem() const { return setCurrentItem_ != nullptr; }

    static constexpr auto fields() {
        return std::tuple{optional(1, "upsertWithItems", &Self::upsertWithItems_),
                          optional(2, "destroy", &Self::destroy_),
                          optional(3, "setRate", &Self::setRate_),
                          optional(4, "replaceCurrentItem", &Self::replaceCurrentItem_),
                          optional(5, "setStatus", &Self::setStatus_),
                          optional(6, "advanceToNextItem", &Self::advanceToNextItem_),
                          optional(7, "appendItem", &Self::appendItem_),
                          optional(8, "removeItem", &Self::removeItem_),
                          optional(9, "removeAllItems", &Self::removeAllItems_),
                          optional(10, "setCurrentItem", &Self::setCurrentItem_)};
    }

private:
    std::shared_ptr<VLProtoAudioFileQueuePlayerSetItems> upsertWithItems_;
    std::shared_ptr<VLProtoObjectMessage> destroy_;
    std::shared_ptr<VLProtoAudioFileQueuePlayerSetRate> setRate_;
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> replaceCurrentItem_;
    std::shared_ptr<VLProtoAudioFilePlayerStatus> setStatus_;
    std::shared_ptr<VLProtoObjectMessage> advanceToNextItem_;
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> appendItem_;
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> removeItem_;
    std::shared_ptr<VLProtoObjectMessage> removeAllItems_;
    std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> setCurrentItem_;
};

extern template class Message<VLProtoAudioFileQueuePlayer>;

} // namespace tarn
