#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>

#include "roles/Data.h"
#include "wire/Dictionary.h"

namespace tarn {

class ProtoReader;
class ProtoWriter;

/// A wire message: what all of them can do. Messages hold no locks; one thread at a time uses a message.
class ProtoCodable {
public:
    virtual ~ProtoCodable() = default;
    ProtoCodable(const ProtoCodable&) = delete;
    ProtoCodable& operator=(const ProtoCodable&) = delete;

    /// Decodes the fields up to the reader's end into this message. On false the message is to be discarded.
    virtual bool readFrom(ProtoReader& reader) = 0;

    /// Encodes the fields that are present, in the order of their numbers.
    virtual void writeTo(ProtoWriter& writer) const = 0;

    /// Field by field; false unless `other` is of the same class. A list that was emptied differs from one
    /// that was never made, and not-a-number from everything.
    virtual bool isEqual(const ProtoCodable& other) const = 0;

    virtual std::uint32_t hash() const = 0;

    /// The present fields by their wire names.
    virtual Dictionary dictionaryRepresentation() const = 0;

    /// Class, address and dictionary representation, for logs.
    virtual std::string description() const = 0;

    /// The message's encoding, as it goes over the wire.
    Data serialize() const;

protected:
    ProtoCodable() = default;
};

} // namespace tarn
