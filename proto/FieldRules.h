#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "proto/FieldRow.h"
#include "proto/MessagePool.h"
#include "wire/ProtoReader.h"
#include "wire/ProtoWriter.h"

/// What each operation of a message does to one field: one overload for each kind of value.
///
/// Which fields an operation touches (required, present, flagged) is decided by Message.
namespace tarn::fieldRules {

// read: replaces or appends; false when decoding has to stop here.

bool read(ProtoReader& reader, std::optional<std::string>& value);
bool read(ProtoReader& reader, std::optional<Data>& value);
bool read(ProtoReader& reader, WireTextList& value);
inline bool read(ProtoReader& reader, float& value) {
    value = reader.readFloat();
    return true;
}

inline bool read(ProtoReader& reader, double& value) {
    value = reader.readDouble();
    return true;
}

/// Numbers of 32 bits keep the low half of what was sent; a truth value is true unless that is zero.
template <std::integral Number>
bool read(ProtoReader& reader, Number& value) {
    value = static_cast<Number>(reader.readVarint());
    return true;
}

template <std::derived_from<ProtoCodable> Embedded>
bool read(ProtoReader& reader, std::shared_ptr<Embedded>& value) {
    value = newMessage<Embedded>();
    std::uint32_t mark = 0;
    if (!reader.placeMark(mark) || !value->readFrom(reader))
        return false;
    reader.recallMark(mark);
    return true;
}

template <std::derived_from<ProtoCodable> Embedded>
bool read(ProtoReader& reader, WireList<std::shared_ptr<Embedded>>& value) {
    return read(reader, listCreateIfNeeded(value).emplace_back());
}

// pass: reads over a value, as strictly as read() does, and keeps nothing of it.

template <WireScalar Scalar>
bool pass(ProtoReader& reader) {
    Scalar ignored;
    return read(reader, ignored);
}

template <class Text>
requires WireText<Text> || std::same_as<Text, WireTextList>
bool pass(ProtoReader& reader) {
    reader.readData();
    return true;
}

template <WireMessage Embedded>
bool pass(ProtoReader& reader) {
    std::uint32_t mark = 0;
    if (!reader.placeMark(mark) || !Embedded::element_type::pass(reader))
        return false;
    reader.recallMark(mark);
    return true;
}

template <WireMessageList List>
bool pass(ProtoReader& reader) {
    return pass<typename List::value_type::value_type>(reader);
}

// write: the value behind its key. A required text that holds nothing has length 0.

void write(ProtoWriter& writer, unsigned number, const std::optional<std::string>& value);
void write(ProtoWriter& writer, unsigned number, const std::optional<Data>& value);
void write(ProtoWriter& writer, unsigned number, const WireTextList& value);
inline void write(ProtoWriter& writer, unsigned number, bool value) { writer.writeBool(value, number); }
inline void write(ProtoWriter& writer, unsigned number, std::int32_t value) {
    writer.writeInt32(value, number);
}
inline void write(ProtoWriter& writer, unsigned number, std::int64_t value) {
    writer.writeInt64(value, number);
}
inline void write(ProtoWriter& writer, unsigned number, std::uint32_t value) {
    writer.writeUint32(value, number);
}
inline void write(ProtoWriter& writer, unsigned number, std::uint64_t value) {
    writer.writeUint64(value, number);
}
inline void write(ProtoWriter& writer, unsigned number, float value) { writer.writeFloat(value, number); }
inline void write(ProtoWriter& writer, unsigned number, double value) { writer.writeDouble(value, number); }

template <std::derived_from<ProtoCodable> Embedded>
void write(ProtoWriter& writer, unsigned number, const std::shared_ptr<Embedded>& value) {
    writer.writeMessage(*value, number);
}

template <std::derived_from<ProtoCodable> Embedded>
void write(ProtoWriter& writer, unsigned number, const WireList<std::shared_ptr<Embedded>>& value) {
    for (const auto& element : *value)
        writer.writeMessage(*element, number);
}

// holds: is there an object at all? An emptied list is one.

template <class Object>
bool holds(const std::optional<Object>& value) {
    return value.has_value();
}

template <class Embedded>
bool holds(const std::shared_ptr<Embedded>& value) {
    return value != nullptr;
}

// carries: is there something to copy or merge? An emptied list is nothing.

template <class Object>
bool carries(const Object& value) {
    return holds(value);
}

template <WireAnyList List>
bool carries(const List& value) {
    return value && !value->empty();
}

// deepCopy: only embedded messages are shared by an assignment and need more than that.

template <class Value>
Value deepCopy(const Value& value) {
    return value;
}

template <std::derived_from<ProtoCodable> Embedded>
std::shared_ptr<Embedded> deepCopy(const std::shared_ptr<Embedded>& value) {
    return value->copyWithZone();
}

template <std::derived_from<ProtoCodable> Embedded>
WireList<std::shared_ptr<Embedded>> deepCopy(const WireList<std::shared_ptr<Embedded>>& value) {
    std::vector<std::shared_ptr<Embedded>> copies;
    copies.reserve(value->size());
    for (const auto& element : *value)
        copies.push_back(deepCopy(element));
    return copies;
}

// merge: what `other` carries replaces, is merged into or is appended to `value`.

template <class Value>
void merge(Value& value, const Value& other) {
    value = other;
}

template <std::derived_from<ProtoCodable> Embedded>
void merge(std::shared_ptr<Embedded>& value, const std::shared_ptr<Embedded>& other) {
    if (value)
        value->mergeFrom(*other);
    else
        value = other;
}

template <std::derived_from<ProtoCodable> Embedded>
void merge(WireList<std::shared_ptr<Embedded>>& value, const WireList<std::shared_ptr<Embedded>>& other) {
    // The two may be one list. NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
    const auto added = *other;
    auto& list = listCreateIfNeeded(value);
    list.insert(list.end(), added.begin(), added.end());
}

inline void merge(WireTextList& value, const WireTextList& other) {
    listCreateIfNeeded(value).append(*other);
}

// equal

template <class Value>
bool equal(const Value& left, const Value& right) {
    return left == right;
}

template <std::derived_from<ProtoCodable> Embedded>
bool equal(const std::shared_ptr<Embedded>& left, const std::shared_ptr<Embedded>& right) {
    return left && right ? left->isEqual(*right) : left == right;
}

template <std::derived_from<ProtoCodable> Embedded>
bool equal(const WireList<std::shared_ptr<Embedded>>& left,
           const WireList<std::shared_ptr<Embedded>>& right) {
    if (!left || !right)
        return left.has_value() == right.has_value();
    return std::equal(left->begin(), left->end(), right->begin(), right->end(),
                      [](const auto& one, const auto& other) { return equal(one, other); });
}

// hash: one term of the message's hash.

std::uint32_t hash(const std::optional<std::string>& value);
std::uint32_t hash(const std::optional<Data>& value);
std::uint32_t hash(const WireTextList& value);
std::uint32_t hash(double value);
std::uint32_t hashOfElements(std::uint32_t before, std::uint32_t element);

template <std::integral Number>
std::uint32_t hash(Number value) {
    constexpr std::uint32_t factor = 2654435761U;
    return factor * static_cast<std::uint32_t>(value);
}

template <std::derived_from<ProtoCodable> Embedded>
std::uint32_t hash(const std::shared_ptr<Embedded>& value) {
    return value->hash();
}

template <std::derived_from<ProtoCodable> Embedded>
std::uint32_t hash(const WireList<std::shared_ptr<Embedded>>& value) {
    std::uint32_t result = 0;
    for (const auto& element : *value)
        result = hashOfElements(result, hash(element));
    return result;
}

// put: the field's entry in the dictionary representation.

template <class Value>
void put(Dictionary& dictionary, std::string_view name, const Value& value) {
    dictionary.emplace(name, DictionaryValue{value});
}

template <class Object>
void put(Dictionary& dictionary, std::string_view name, const std::optional<Object>& value) {
    dictionary.emplace(name, DictionaryValue{*value});
}

void put(Dictionary& dictionary, std::string_view name, const WireTextList& value);

template <std::derived_from<ProtoCodable> Embedded>
void put(Dictionary& dictionary, std::string_view name, const std::shared_ptr<Embedded>& value) {
    dictionary.emplace(name, DictionaryValue{value->dictionaryRepresentation()});
}

/// A list of messages that was emptied has no entry; one of strings has.
template <std::derived_from<ProtoCodable> Embedded>
void put(Dictionary& dictionary, std::string_view name, const WireList<std::shared_ptr<Embedded>>& value) {
    DictionaryList list;
    for (const auto& element : *value)
        list.push_back({element->dictionaryRepresentation()});
    if (!list.empty())
        dictionary.emplace(name, DictionaryValue{std::move(list)});
}

} // namespace tarn::fieldRules
