#include "proto/TransportReply.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<TransportReply>;

} // namespace tarn
