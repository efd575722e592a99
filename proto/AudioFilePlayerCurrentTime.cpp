#include "proto/AudioFilePlayerCurrentTime.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerCurrentTime>;

} // namespace tarn
