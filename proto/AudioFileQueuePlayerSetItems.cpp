#include "proto/AudioFileQueuePlayerSetItems.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFileQueuePlayerSetItems>;

void VLProtoAudioFileQueuePlayerSetItems::clearPlayerItemIdentifiers() {
    if (playerItemIdentifiers_)
        playerItemIdentifiers_->clear();
}

void VLProtoAudioFileQueuePlayerSetItems::addPlayerItemIdentifiers(std::string_view element) {
    if (!playerItemIdentifiers_)
        playerItemIdentifiers_.emplace();
    playerItemIdentifiers_->push_back(element);
}

} // namespace tarn
