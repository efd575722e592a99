#pragma once

#include <algorithm>
#include <functional>
#include <random>
#include <string>
#include <vector>

#include "proto/FieldRow.h"
#include "wire/ProtoWriter.h"

namespace tarn {

/// Makes random encodings of any message from its field table.
///
/// Plain ones are written as the messages themselves write: required fields and a random choice of the
/// others, in order. Scrambled ones are as correct but come in any order, with unknown fields in between and
/// with scalars, texts and list elements repeated; an embedded message comes at most once.
class Generator {
public:
    enum class Style { plain, scrambled };

    Generator(unsigned seed, Style style) : random_(seed), style_(style) {}

    template <class Message>
    Data encodingOf() {
        std::vector<Data> parts;
        std::apply([&](const auto&... row) { (addField(parts, row), ...); }, Message::fields());
        if (style_ == Style::scrambled) {
            parts.push_back(unknownField());
            std::ranges::shuffle(parts, random_);
        }
        Data whole;
        for (const Data& part : parts)
            whole.insert(whole.end(), part.begin(), part.end());
        return whole;
    }

    unsigned below(unsigned limit) { return static_cast<unsigned>(random_() % limit); }

private:
    template <class Row>
    void addField(std::vector<Data>& parts, const Row& row) {
        using Value = typename Row::Value;
        if (!row.isRequired && below(3) == 0)
            return;
        unsigned count = 1;
        if (row.label == FieldLabel::repeated)
            count = below(4);
        else if (style_ == Style::scrambled && !WireMessage<Value>)
            count = 1 + below(2);
        for (unsigned index = 0; index < count; ++index) {
            ProtoWriter writer;
            write(writer, row.number, static_cast<Value*>(nullptr));
            parts.push_back(writer.data());
        }
    }

    // The value is random; the pointer, which is null, only tells its kind.

    void write(ProtoWriter& writer, unsigned number, bool*) { writer.writeBool(below(2) == 0, number); }
    void write(ProtoWriter& writer, unsigned number, std::int32_t*) {
        writer.writeInt32(static_cast<std::int32_t>(bits()), number);
    }
    void write(ProtoWriter& writer, unsigned number, std::int64_t*) {
        writer.writeInt64(static_cast<std::int64_t>(bits()), number);
    }
    void write(ProtoWriter& writer, unsigned number, std::uint32_t*) {
        writer.writeUint32(static_cast<std::uint32_t>(bits()), number);
    }
    void write(ProtoWriter& writer, unsigned number, std::uint64_t*) { writer.writeUint64(bits(), number); }
    void write(ProtoWriter& writer, unsigned number, float*) {
        writer.writeFloat(static_cast<float>(below(1000)) / 8 - 50, number);
    }
    void write(ProtoWriter& writer, unsigned number, double*) {
        writer.writeDouble(static_cast<double>(below(100000)) / 64 - 500, number);
    }

    template <WireText Value>
    void write(ProtoWriter& writer, unsigned number, Value*) {
        writer.writeString(text(), number);
    }
    void write(ProtoWriter& writer, unsigned number, WireTextList*) { writer.writeString(text(), number); }

    template <WireMessage Value>
    void write(ProtoWriter& writer, unsigned number, Value*) {
        writer.writeData(encodingOf<typename Value::element_type>(), number);
    }
    template <WireMessageList Value>
    void write(ProtoWriter& writer, unsigned number, Value*) {
        write(writer, number, static_cast<typename Value::value_type::value_type*>(nullptr));
    }

    /// Of any length from nothing to all 64.
    std::uint64_t bits() { return (std::uint64_t{random_()} << 32 | random_()) >> below(64); }

    std::string text() {
        static const std::string pieces[] = {"",
                                             "a",
                                             "item-7",
                                             "Größe",
                                             "\xE2\x82\xAC",
                                             "\xF0\x9F\x8E\xB5",
                                             "a longer text that fits nowhere",
                                             std::string(1, '\0')};
        std::string result;
        for (unsigned count = below(4); count > 0; --count)
            result += pieces[below(std::size(pieces))];
        if (below(20) == 0)
            result.append(200, 'x'); // makes the length of what holds it longer than one byte
        return result;
    }

    Data unknownField() {
        ProtoWriter writer;
        const unsigned number = 20 + below(1000);
        switch (below(4)) {
        case 0:
            writer.writeUint64(bits(), number);
            break;
        case 1:
            writer.writeDouble(1, number);
            break;
        case 2:
            writer.writeFloat(1, number);
            break;
        default:
            writer.writeString(text(), number);
            break;
        }
        return writer.data();
    }

    std::mt19937 random_;
    Style style_;
};

} // namespace tarn
