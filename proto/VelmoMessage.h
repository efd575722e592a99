#pragma once

#include <memory>
#include <string_view>

#include "proto/AudioFilePlayerMessage.h"
#include "proto/Message.h"
#include "proto/VelmoPlist.h"

namespace tarn {

/// The envelope: everything that a client sends, and every event that it is sent, is one of these.
///
/// The property list belongs to other users of the same envelope. This system neither makes one nor looks at
/// the values of one.
class VLProtoVelmoMessage final : public Message<VLProtoVelmoMessage> {
public:
    static constexpr std::string_view className = "VLProtoVelmoMessage";

    /// As fromData(), but the message is without its property list. The list is checked as strictly and then
    /// forgotten: a frame may hold half a million values, which would take more than a hundred megabytes.
    static std::shared_ptr<VLProtoVelmoMessage> fromDataWithoutPlist(std::span<const std::uint8_t> data);

    const std::shared_ptr<VLProtoVelmoPlist>& plist() const { return plist_; }
    void setPlist(std::shared_ptr<VLProtoVelmoPlist> message) { plist_ = std::move(message); }
    bool hasPlist() const { return plist_ != nullptr; }

    const std::shared_ptr<VLProtoAudioFilePlayerMessage>& audioFilePlayerMessage() const {
        return audioFilePlayerMessage_;
    }
    void setAudioFilePlayerMessage(std::shared_ptr<VLProtoAudioFilePlayerMessage> message) {
        audioFilePlayerMessage_ = std::move(message);
    }
    bool hasAudioFilePlayerMessage() const { return audioFilePlayerMessage_ != nullptr; }

    /// A new envelope around a new audio message that holds `subMessage` itself in the field of `setter`.
    template <class Container>
    static std::shared_ptr<VLProtoVelmoMessage>
    velmoMessageWithSubMessage(std::shared_ptr<Container> subMessage,
                               void (VLProtoAudioFilePlayerMessage::*setter)(std::shared_ptr<Container>)) {
        auto audioMessage = std::make_shared<VLProtoAudioFilePlayerMessage>();
        ((*audioMessage).*setter)(std::move(subMessage));
        auto envelope = std::make_shared<VLProtoVelmoMessage>();
        envelope->setAudioFilePlayerMessage(std::move(audioMessage));
        return envelope;
    }

    static constexpr auto fields() {
        return std::tuple{optional(1, "plist", &Self::plist_),
                          optional(2, "audioFilePlayerMessage", &Self::audioFilePlayerMessage_)};
    }

private:
    std::shared_ptr<VLProtoVelmoPlist> plist_;
    std::shared_ptr<VLProtoAudioFilePlayerMessage> audioFilePlayerMessage_;
};

extern template class Message<VLProtoVelmoMessage>;

} // namespace tarn
