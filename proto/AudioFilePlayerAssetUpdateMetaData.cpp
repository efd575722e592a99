#include "proto/AudioFilePlayerAssetUpdateMetaData.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerAssetUpdateMetaData>;

} // namespace tarn
