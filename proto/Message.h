#pragma once

#include <bitset>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "proto/FieldRow.h"
#include "wire/ProtoCodable.h"
#include "wire/ProtoReader.h"

namespace tarn {

/// The rules that all wire messages share, over the field table of the class: `Class::fields()` tells each
/// field's number, wire name and place.
///
/// Accessors of a field `name`:
/// - text and bytes: `const std::optional<std::string>& name()`, `setName(value or std::nullopt)`; absent and
///   empty differ;
/// - embedded message: `const std::shared_ptr<Class>& name()`, `setName(message or nullptr)`; the message
///   itself is stored, not a copy;
/// - scalar: `name()` (0 when it was never set), `setName(value)`;
/// - optional fields: `hasName()`, and for scalars `setHasName(present)`, which leaves the value alone;
/// - repeated: see the two classes that have one.
///
/// Decoding is lenient where the wire rules are (unknown fields, missing required ones), never allocates
/// ahead of what has arrived and nests no deeper than the classes do.
template <class Class>
class Message : public ProtoCodable {
public:
    /// Null when the bytes cannot be decoded. No bytes are an empty message.
    static std::shared_ptr<Class> fromData(std::span<const std::uint8_t> data);

    /// Would readFrom() succeed? Moves the reader as that does, and builds nothing.
    static bool pass(ProtoReader& reader);

    bool readFrom(ProtoReader& reader) final;
    void writeTo(ProtoWriter& writer) const final;

    /// Sets on `other` what is present here; embedded messages are shared with it afterwards.
    void copyTo(Class& other) const;

    /// A copy that shares nothing with this message.
    std::shared_ptr<Class> copyWithZone() const;

    /// Replaces by what `other` has, merges embedded messages that both have, and appends lists. A message
    /// that only `other` has is shared with it afterwards.
    void mergeFrom(const Class& other);

    bool isEqual(const ProtoCodable& other) const final;
    bool isEqual(const Class& other) const;
    std::uint32_t hash() const final;
    Dictionary dictionaryRepresentation() const final;
    std::string description() const final;

protected:
    using Self = Class;

    /// Reads field after field; `readValue(row)` reads the value of a field that the class has, and is false
    /// when decoding has to stop there.
    template <class ReadValue>
    static bool readFields(ProtoReader& reader, ReadValue readValue);

    /// Sets an optional scalar and marks it present.
    template <WireScalar Scalar>
    void setFlagged(unsigned fieldNumber, Scalar& field, Scalar value) {
        field = value;
        presence_.set(fieldNumber);
    }

    /// Which optional scalars are present, by field number.
    std::bitset<16> presence_;

private:
    const Class& self() const { return static_cast<const Class&>(*this); }
    Class& self() { return static_cast<Class&>(*this); }

    template <class Row>
    bool hasValue(const Row& row) const;
    template <class Row>
    bool isCarried(const Row& row) const;
    template <class Row>
    bool isEqualIn(const Row& row, const Class& other) const;
};

} // namespace tarn
