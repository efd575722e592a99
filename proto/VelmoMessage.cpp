#include "proto/VelmoMessage.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoVelmoMessage>;

} // namespace tarn
