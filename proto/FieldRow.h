#pragma once

#include <concepts>
#include <cstdint>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <vector>

#include "proto/TextList.h"
#include "roles/Data.h"
#include "wire/ProtoCodable.h"

namespace tarn {

template <class Value, class... Choices>
concept OneOf = (std::same_as<Value, Choices> || ...);

/// How a message holds a scalar: as it is, beside a presence flag when the field is optional.
template <class Value>
concept WireScalar =
    OneOf<Value, bool, std::int32_t, std::int64_t, std::uint32_t, std::uint64_t, float, double>;

/// How a message holds text or bytes: absent and empty differ.
template <class Value>
concept WireText = OneOf<Value, std::optional<std::string>, std::optional<Data>>;

/// How a message holds an embedded message: shared, so that a payload can be stored in several.
template <class Value>
concept WireMessage = std::derived_from<typename Value::element_type, ProtoCodable> &&
    std::same_as<Value, std::shared_ptr<typename Value::element_type>>;

/// How a message holds a repeated field: an emptied list differs from one that was never made.
using WireTextList = std::optional<TextList>;
template <WireMessage Element>
using WireList = std::optional<std::vector<Element>>;

template <class Value>
concept WireMessageList = WireMessage<typename Value::value_type::value_type> &&
    std::same_as<Value, WireList<typename Value::value_type::value_type>>;

template <class Value>
concept WireAnyList = std::same_as<Value, WireTextList> || WireMessageList<Value>;

// What messages do with a list of theirs, which is there from the first element on.

template <class List>
List& listCreateIfNeeded(std::optional<List>& list) {
    return list ? *list : list.emplace();
}

template <class List>
void clearList(std::optional<List>& list) {
    if (list)
        list->clear();
}

/// Throws std::out_of_range, also without a list.
template <class List>
decltype(auto) elementAt(const std::optional<List>& list, std::size_t index) {
    if (!list)
        throw std::out_of_range("an element of a list that is not there");
    return list->at(index);
}

/// Everything that a field can be.
template <class Value>
concept WireValue = WireScalar<Value> || WireText<Value> || WireMessage<Value> || WireAnyList<Value>;

enum class FieldLabel { required, optional, repeated };

/// One row of a message's field table.
template <class Owner, WireValue Value_, FieldLabel label_>
struct FieldRow {
    using Value = Value_;
    static constexpr FieldLabel label = label_;
    static constexpr bool isRequired = label == FieldLabel::required;
    static constexpr bool hasPresenceFlag = label == FieldLabel::optional && WireScalar<Value>;

    unsigned number;
    std::string_view name; // also the key in the dictionary representation
    Value Owner::*member;
};

// What a field table is written with: the field's number, its wire name and where its value is held.

template <class Owner, class Value>
constexpr auto required(unsigned number, std::string_view name, Value Owner::*member) {
    return FieldRow<Owner, Value, FieldLabel::required>{number, name, member};
}

template <class Owner, class Value>
constexpr auto optional(unsigned number, std::string_view name, Value Owner::*member) {
    return FieldRow<Owner, Value, FieldLabel::optional>{number, name, member};
}

template <class Owner, class Value>
constexpr auto repeated(unsigned number, std::string_view name, Value Owner::*member) {
    return FieldRow<Owner, Value, FieldLabel::repeated>{number, name, member};
}

template <class... Rows>
constexpr bool numbersAscend(const std::tuple<Rows...>& rows) {
    return std::apply(
        [](const auto&... row) {
            unsigned previous = 0;
            return ((row.number > previous && (previous = row.number, true)) && ...);
        },
        rows);
}

} // namespace tarn
