#include "proto/AudioFilePlayerItem.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerItem>;

} // namespace tarn
