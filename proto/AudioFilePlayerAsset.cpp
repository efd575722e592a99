#include "proto/AudioFilePlayerAsset.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerAsset>;

} // namespace tarn
