#include "platform/core/ProtoCodable.h"

#include "platform/core/ProtoWriter.h"

namespace tarn {

Data ProtoCodable::serialize() const {
    ProtoWriter writer;
    writeTo(writer);
    return writer.data();
}

} // namespace tarn
