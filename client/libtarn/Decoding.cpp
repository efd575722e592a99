#include "client/libtarn/Decoding.h"

#include "client/libtarn/ErrorTexts.h"
#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

client::Status statusOf(const VLProtoAudioFilePlayerStatus& message) {
    client::Status status{static_cast<client::Status::Value>(message.status()), std::nullopt,
                          message.identifier()};
    if (message.hasErrorDomain() || message.hasErrorCode())
        status.error = client::Error{message.errorDomain().value_or(""), message.errorCode(),
                                     readErrorTexts(message.errorDict().value_or(Data()))};
    return status;
}

template <class Message>
std::string identifierOf(const Message& message) {
    return message.identifier().value_or("");
}

std::optional<client::Event> eventOf(const VLProtoAudioFilePlayerItem& item) {
    if (const auto& status = item.setStatus())
        return client::ItemStatusChanged{identifierOf(*status), statusOf(*status)};
    if (const auto& jumped = item.notifyTimeJumped())
        return client::ItemTimeJumped{identifierOf(*jumped)};
    if (const auto& ended = item.notifyDidPlayToEndTime())
        return client::ItemPlayedToEnd{identifierOf(*ended)};
    if (const auto& failed = item.notifyFailedToPlayToEndTime())
        return client::ItemFailedToPlayToEnd{identifierOf(*failed)};
    return std::nullopt;
}

std::optional<client::Event> eventOf(const VLProtoAudioFileQueuePlayer& player) {
    if (const auto& status = player.setStatus())
        return client::PlayerStatusChanged{identifierOf(*status), statusOf(*status)};
    if (const auto& rate = player.setRate())
        return client::PlayerRateChanged{identifierOf(*rate), rate->rate()};
    if (const auto& current = player.setCurrentItem())
        return client::CurrentItemChanged{identifierOf(*current), current->containedIdentifier()};
    return std::nullopt;
}

} // namespace

std::optional<client::AssetInfo> decodeAssetInfo(const Data& payload) {
    const auto message = VLProtoAudioFilePlayerAssetUpdateMetaData::fromData(payload);
    if (!message)
        return std::nullopt;
    return client::AssetInfo{message->duration(), message->title(), message->albumTitle(), message->artist()};
}

std::optional<client::Status> decodeStatus(const Data& payload) {
    const auto message = VLProtoAudioFilePlayerStatus::fromData(payload);
    return message ? std::optional(statusOf(*message)) : std::nullopt;
}

std::optional<double> decodeCurrentTime(const Data& payload) {
    const auto message = VLProtoAudioFilePlayerCurrentTime::fromData(payload);
    return message ? std::optional(message->currentTime()) : std::nullopt;
}

std::optional<client::Event> decodeEvent(const Data& envelope) {
    const auto message = VLProtoVelmoMessage::fromDataWithoutPlist(envelope);
    if (!message || !message->audioFilePlayerMessage())
        return std::nullopt;
    const auto& audio = *message->audioFilePlayerMessage();
    if (audio.playerItem())
        return eventOf(*audio.playerItem());
    if (audio.queuePlayer())
        return eventOf(*audio.queuePlayer());
    return std::nullopt;
}

} // namespace tarn
