#pragma once

#include <tuple>

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/VelmoMessage.h"

namespace tarn {

/// Calls `visit.operator()<Message>()` for every class of message.
template <class... Messages>
struct MessageList {
    template <class Visitor>
    static void forEach(Visitor visit) {
        (visit.template operator()<Messages>(), ...);
    }

    template <template <class...> class Target>
    using As = Target<Messages...>;
};

using AllMessages =
    MessageList<VLProtoVelmoMessage, VLProtoAudioFilePlayerMessage, VLProtoAudioFilePlayerAsset,
                VLProtoAudioFilePlayerItem, VLProtoAudioFileQueuePlayer, VLProtoObjectMessage,
                VLProtoAudioFilePlayerUpdateContainedIdentifier, VLProtoAudioFilePlayerAssetUpdateMetaData,
                VLProtoAudioFilePlayerStatus, VLProtoAudioFileQueuePlayerSetItems,
                VLProtoAudioFileQueuePlayerSetRate, VLProtoAudioFilePlayerItemSetCurrentTime,
                VLProtoAudioFilePlayerCurrentTime, VLProtoVelmoPlist, VLProtoVelmoObject>;

} // namespace tarn
