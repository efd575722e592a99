#include "proto/AudioFileQueuePlayerSetRate.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFileQueuePlayerSetRate>;

} // namespace tarn
