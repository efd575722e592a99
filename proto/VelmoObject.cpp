#include "proto/VelmoObject.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoVelmoObject>;

} // namespace tarn
