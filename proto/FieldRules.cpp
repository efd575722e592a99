#include "proto/FieldRules.h"

#include <cmath>
#include <functional>
#include <limits>
#include <string_view>

namespace tarn::fieldRules {

bool read(ProtoReader& reader, std::optional<std::string>& value) {
    if (const auto text = reader.readString())
        value.emplace(*text);
    else
        value.reset();
    return true;
}

bool read(ProtoReader& reader, std::optional<Data>& value) {
    if (const auto bytes = reader.readData())
        value.emplace(bytes->begin(), bytes->end());
    else
        value.reset();
    return true;
}

/// With the first text, room is made for the characters of all that the message still holds.
bool read(ProtoReader& reader, WireTextList& value) {
    const auto text = reader.readString();
    if (!text)
        return true;
    if (!value) {
        const std::size_t rest = reader.length() - reader.position();
        value.emplace().reserve(text->size() + rest);
    }
    value->push_back(*text);
    return true;
}

void write(ProtoWriter& writer, unsigned number, const std::optional<std::string>& value) {
    writer.writeString(value ? std::string_view(*value) : std::string_view(), number);
}

void write(ProtoWriter& writer, unsigned number, const std::optional<Data>& value) {
    writer.writeData(value ? std::span(*value) : std::span<const std::uint8_t>(), number);
}

void write(ProtoWriter& writer, unsigned number, const WireTextList& value) {
    for (std::size_t index = 0; index < value->size(); ++index)
        writer.writeString(value->at(index), number);
}

namespace {

std::uint32_t hashOfBytes(std::string_view bytes) {
    return static_cast<std::uint32_t>(std::hash<std::string_view>()(bytes));
}

/// Rounds toward zero and saturates; not-a-number gives 0.
std::uint32_t saturatedToUint32(double value) {
    constexpr double highest = std::numeric_limits<std::uint32_t>::max();
    if (!(value > 0))
        return 0;
    return value >= highest ? std::numeric_limits<std::uint32_t>::max() : static_cast<std::uint32_t>(value);
}

} // namespace

std::uint32_t hash(const std::optional<std::string>& value) { return hashOfBytes(*value); }

std::uint32_t hash(const std::optional<Data>& value) {
    return hashOfBytes({reinterpret_cast<const char*>(value->data()), value->size()});
}

std::uint32_t hash(const WireTextList& value) {
    std::uint32_t result = 0;
    for (std::size_t index = 0; index < value->size(); ++index)
        result = hashOfElements(result, hashOfBytes(value->at(index)));
    return result;
}

std::uint32_t hash(double value) {
    constexpr double range = 4294967295.0;
    const double magnitude = std::fabs(value);
    const double rounded = std::floor(magnitude + 0.5);
    return hash(saturatedToUint32(std::fmod(rounded, range))) +
           saturatedToUint32((magnitude - rounded) * range);
}

std::uint32_t hashOfElements(std::uint32_t before, std::uint32_t element) {
    return before * 31 + element + 1;
}

void put(Dictionary& dictionary, std::string_view name, const WireTextList& value) {
    DictionaryList list;
    for (std::size_t index = 0; index < value->size(); ++index)
        list.push_back({std::string(value->at(index))});
    dictionary.emplace(name, DictionaryValue{std::move(list)});
}

} // namespace tarn::fieldRules
