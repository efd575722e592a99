// The operations of every message class, made from the rules that all of them share. The compiler takes some
// ten seconds for this, so it is done in this file and in no other.

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/MessageRules.h"
#include "proto/TransportExtension.h"
#include "proto/TransportReply.h"
#include "proto/VelmoMessage.h"

namespace tarn {

template class Message<VLProtoObjectMessage>;
template class Message<VLProtoAudioFilePlayerUpdateContainedIdentifier>;
template class Message<VLProtoAudioFilePlayerAssetUpdateMetaData>;
template class Message<VLProtoAudioFilePlayerStatus>;
template class Message<VLProtoAudioFilePlayerItemSetCurrentTime>;
template class Message<VLProtoAudioFilePlayerCurrentTime>;
template class Message<VLProtoAudioFileQueuePlayerSetItems>;
template class Message<VLProtoAudioFileQueuePlayerSetRate>;

template class Message<VLProtoAudioFilePlayerAsset>;
template class Message<VLProtoAudioFilePlayerItem>;
template class Message<VLProtoAudioFileQueuePlayer>;
template class Message<VLProtoAudioFilePlayerMessage>;

template class Message<VLProtoVelmoObject>;
template class Message<VLProtoVelmoPlist>;
template class Message<VLProtoVelmoMessage>;

template class Message<TransportEntry>;
template class Message<TransportError>;
template class Message<TransportReply>;
template class Message<TransportExtension>;

std::shared_ptr<VLProtoVelmoMessage>
VLProtoVelmoMessage::fromDataWithoutPlist(std::span<const std::uint8_t> data) {
    auto message = newMessage<VLProtoVelmoMessage>();
    ProtoReader reader(data);
    const bool decoded = readFields(reader, [&]<class Row>(const Row& row) {
        if constexpr (std::same_as<typename Row::Value, std::shared_ptr<VLProtoVelmoPlist>>)
            return fieldRules::pass<typename Row::Value>(reader);
        else
            return fieldRules::read(reader, (*message).*row.member);
    });
    return decoded ? message : nullptr;
}

} // namespace tarn
