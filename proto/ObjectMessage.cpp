#include "proto/ObjectMessage.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoObjectMessage>;

} // namespace tarn
