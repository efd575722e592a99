#include "proto/AudioFileQueuePlayerSetItems.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFileQueuePlayerSetItems>;

void VLProtoAudioFileQueuePlayerSetItems::clearPlayerItemIdentifiers() {
    if (playerItemIdentifiers_)
        playerItemIdentifiers_->clear();
}

void VLProtoAudioFileQueuePlayerSetItems::addPlayerItemIdentifiers(std::string element) {
    if (!playerItemIdentifiers_)
        playerItemIdentifiers_.emplace();
    playerItemIdentifiers_->push_back(std::move(element));
}

} // namespace tarn
