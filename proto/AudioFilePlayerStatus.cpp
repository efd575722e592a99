#include "proto/AudioFilePlayerStatus.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerStatus>;

} // namespace tarn
