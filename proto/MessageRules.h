#pragma once

// The definitions of Message, for Messages.cpp, where the compiler makes the code of all messages from them.

#include <sstream>
#include <tuple>
#include <typeinfo>

#include "proto/FieldRules.h"
#include "proto/Message.h"
#include "wire/ProtoReader.h"
#include "wire/ProtoWriter.h"

namespace tarn {

/// The rows of a class, checked once.
template <class Class>
inline constexpr auto rowsOf = Class::fields();

/// Calls `visit` with each row, in the order of the field numbers.
template <class Class, class Visitor>
void forEachRow(Visitor visit) {
    static_assert(numbersAscend(rowsOf<Class>), "a field table is written in the order of the numbers");
    std::apply([&visit](const auto&... row) { (visit(row), ...); }, rowsOf<Class>);
}

template <class Class>
std::shared_ptr<Class> Message<Class>::fromData(std::span<const std::uint8_t> data) {
    auto message = newMessage<Class>();
    ProtoReader reader(data);
    return message->readFrom(reader) ? message : nullptr;
}

template <class Class>
template <class ReadValue>
bool Message<Class>::readFields(ProtoReader& reader, ReadValue readValue) {
    while (reader.position() < reader.length() && !reader.hasError()) {
        const ProtoKey key(reader.readVarint());
        if (key.wireType == WireType::endGroup || reader.hasError())
            break;
        bool goesOn = false;
        const auto readIfIts = [&](const auto& row) {
            if (row.number != key.fieldNumber)
                return false;
            goesOn = readValue(row);
            return true;
        };
        const bool known =
            std::apply([&](const auto&... row) { return (readIfIts(row) || ...); }, rowsOf<Class>);
        if (!(known ? goesOn : reader.skipValue(key.fieldNumber, key.wireType)))
            return false;
    }
    return !reader.hasError();
}

template <class Class>
bool Message<Class>::readFrom(ProtoReader& reader) {
    return readFields(reader, [&]<class Row>(const Row& row) {
        if constexpr (Row::hasPresenceFlag)
            presence_.set(row.number);
        return fieldRules::read(reader, self().*row.member);
    });
}

template <class Class>
bool Message<Class>::pass(ProtoReader& reader) {
    return readFields(reader,
                      [&]<class Row>(const Row&) { return fieldRules::pass<typename Row::Value>(reader); });
}

/// Does the field hold something: an object, or a scalar that is not marked absent?
template <class Class>
template <class Row>
bool Message<Class>::hasValue(const Row& row) const {
    if constexpr (Row::hasPresenceFlag)
        return presence_[row.number];
    else if constexpr (WireScalar<typename Row::Value>)
        return true;
    else
        return fieldRules::holds(self().*row.member);
}

/// Does the field have something to give to another message?
template <class Class>
template <class Row>
bool Message<Class>::isCarried(const Row& row) const {
    if constexpr (WireScalar<typename Row::Value>)
        return hasValue(row);
    else
        return fieldRules::carries(self().*row.member);
}

template <class Class>
void Message<Class>::writeTo(ProtoWriter& writer) const {
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (row.isRequired || hasValue(row))
            fieldRules::write(writer, row.number, self().*row.member);
    });
}

template <class Class>
void Message<Class>::copyTo(Class& other) const {
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (!row.isRequired && !isCarried(row))
            return;
        other.*row.member = self().*row.member;
        if constexpr (Row::hasPresenceFlag)
            other.presence_.set(row.number);
    });
}

template <class Class>
std::shared_ptr<Class> Message<Class>::copyWithZone() const {
    auto copy = newMessage<Class>();
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (!isCarried(row))
            return;
        (*copy).*row.member = fieldRules::deepCopy(self().*row.member);
        if constexpr (Row::hasPresenceFlag)
            copy->presence_.set(row.number);
    });
    return copy;
}

template <class Class>
void Message<Class>::mergeFrom(const Class& other) {
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (!other.isCarried(row))
            return;
        fieldRules::merge(self().*row.member, other.*row.member);
        if constexpr (Row::hasPresenceFlag)
            presence_.set(row.number);
    });
}

template <class Class>
template <class Row>
bool Message<Class>::isEqualIn(const Row& row, const Class& other) const {
    if constexpr (Row::hasPresenceFlag) {
        if (!hasValue(row) || !other.hasValue(row))
            return hasValue(row) == other.hasValue(row);
    }
    return fieldRules::equal(self().*row.member, other.*row.member);
}

template <class Class>
bool Message<Class>::isEqual(const ProtoCodable& other) const {
    return typeid(other) == typeid(Class) && isEqual(static_cast<const Class&>(other));
}

template <class Class>
bool Message<Class>::isEqual(const Class& other) const {
    return std::apply([&](const auto&... row) { return (isEqualIn(row, other) && ...); }, rowsOf<Class>);
}

template <class Class>
std::uint32_t Message<Class>::hash() const {
    std::uint32_t result = 0;
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (hasValue(row))
            result ^= fieldRules::hash(self().*row.member);
    });
    return result;
}

template <class Class>
Dictionary Message<Class>::dictionaryRepresentation() const {
    Dictionary dictionary;
    forEachRow<Class>([&]<class Row>(const Row& row) {
        if (hasValue(row))
            fieldRules::put(dictionary, row.name, self().*row.member);
    });
    return dictionary;
}

template <class Class>
std::string Message<Class>::description() const {
    std::ostringstream text;
    text << '<' << Class::className << ": " << this << "> " << tarn::description(dictionaryRepresentation());
    return text.str();
}

} // namespace tarn
