#include "proto/AudioFilePlayerMessage.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerMessage>;

} // namespace tarn
