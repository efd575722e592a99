#include "proto/TransportEntry.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<TransportEntry>;

} // namespace tarn
