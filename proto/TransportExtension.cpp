#include "proto/TransportExtension.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<TransportExtension>;

} // namespace tarn
