#include "wire/ProtoCodable.h"

#include "wire/ProtoWriter.h"

namespace tarn {

Data ProtoCodable::serialize() const {
    ProtoWriter writer;
    writeTo(writer);
    return writer.data();
}

} // namespace tarn
