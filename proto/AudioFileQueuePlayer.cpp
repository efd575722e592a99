#include "proto/AudioFileQueuePlayer.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFileQueuePlayer>;

} // namespace tarn
