#include "proto/AudioFilePlayerUpdateContainedIdentifier.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoAudioFilePlayerUpdateContainedIdentifier>;

} // namespace tarn
