#include "proto/AudioFilePlayerItemSetCurrentTime.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerItemSetCurrentTime>;

} // namespace tarn
