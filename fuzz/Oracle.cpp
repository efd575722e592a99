#include "fuzz/Oracle.h"

#include <map>
#include <string_view>

namespace tarn {

namespace {

using Bytes = std::span<const std::uint8_t>;

// The fields of each class by number. Kinds: s required text, S optional text, B bytes, L list of texts, i
// required int32, I int32, U uint32, J 64 bits, b bool, f required float, F float, D double; a name in
// parentheses is an embedded message, in brackets a list of them.
const std::map<std::string_view, std::map<std::uint32_t, std::string_view>> classes = {
    {"envelope", {{1, "(plist)"}, {2, "(audio)"}}},
    {"audio", {{1, "(asset)"}, {2, "(item)"}, {3, "(player)"}}},
    {"asset", {{1, "(metadata)"}, {2, "(object)"}}},
    {"item",
     {{1, "(contained)"},
      {2, "(object)"},
      {3, "(status)"},
      {4, "(object)"},
      {5, "(object)"},
      {6, "(object)"},
      {7, "(object)"},
      {8, "(time)"}}},
    {"player",
     {{1, "(items)"},
      {2, "(object)"},
      {3, "(rate)"},
      {4, "(contained)"},
      {5, "(status)"},
      {6, "(object)"},
      {7, "(contained)"},
      {8, "(contained)"},
      {9, "(object)"},
      {10, "(contained)"}}},
    {"object", {{1, "s"}}},
    {"contained", {{1, "s"}, {2, "S"}}},
    {"metadata", {{1, "s"}, {2, "S"}, {3, "D"}, {4, "S"}, {5, "S"}, {6, "S"}, {7, "S"}}},
    {"status", {{1, "S"}, {2, "I"}, {3, "S"}, {4, "J"}, {5, "B"}}},
    {"items", {{1, "s"}, {2, "L"}}},
    {"rate", {{1, "s"}, {2, "f"}}},
    {"time", {{1, "s"}, {2, "D"}}},
    {"plist", {{1, "[value]"}}},
    {"value",
     {{1, "i"},
      {2, "I"},
      {4, "S"},
      {5, "S"},
      {6, "D"},
      {7, "F"},
      {8, "J"},
      {9, "I"},
      {10, "J"},
      {11, "U"},
      {12, "b"},
      {13, "B"}}},
};

void appendVarint(Data& out, std::uint64_t value) {
    for (; value > 127; value /= 128)
        out.push_back(static_cast<std::uint8_t>(128 + value % 128));
    out.push_back(static_cast<std::uint8_t>(value));
}

Data entry(std::uint32_t number, unsigned wireType, Bytes value, bool delimited) {
    Data out;
    appendVarint(out, number * 8 + wireType);
    if (delimited)
        appendVarint(out, value.size());
    out.insert(out.end(), value.begin(), value.end());
    return out;
}

bool isUtf8(Bytes text) {
    for (std::size_t index = 0; index < text.size();) {
        const std::uint8_t lead = text[index];
        const std::size_t length = lead < 0x80 ? 1 : lead < 0xC0 ? 0 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
        if (length == 0 || index + length > text.size())
            return false;
        std::uint32_t value = length == 1 ? lead : lead & (0x7FU >> length);
        for (std::size_t next = 1; next < length; ++next) {
            if (text[index + next] / 64 != 2)
                return false;
            value = value * 64 + text[index + next] % 64;
        }
        const bool shortest = value >= (length == 1   ? 0U
                                        : length == 2 ? 0x80U
                                        : length == 3 ? 0x800U
                                                      : 0x10000U);
        if (!shortest || value > 0x10FFFF || lead >= 0xF8 || (value >= 0xD800 && value <= 0xDFFF))
            return false;
        index += length;
    }
    return true;
}

/// Takes values from the front of its bytes.
class Input {
public:
    explicit Input(Bytes bytes) : bytes_(bytes) {}

    bool empty() const { return bytes_.empty(); }

    std::optional<Bytes> take(std::uint64_t count) {
        if (count > bytes_.size())
            return std::nullopt;
        const Bytes taken = bytes_.first(count);
        bytes_ = bytes_.subspan(count);
        return taken;
    }

    std::optional<std::uint64_t> number() {
        std::uint64_t value = 0;
        for (unsigned shift = 0; shift < 70; shift += 7) {
            const auto byte = take(1);
            if (!byte)
                return std::nullopt;
            value += shift < 64 ? static_cast<std::uint64_t>((*byte)[0] % 128) << shift : 0;
            if ((*byte)[0] < 128)
                return value;
        }
        return 0;
    }

    std::optional<Bytes> delimited() {
        const auto count = number();
        return count ? take(*count) : std::nullopt;
    }

    /// Behind the value of an unknown field; `depth` groups are open around it.
    bool skip(std::uint32_t field, unsigned wireType, unsigned depth = 0) {
        switch (wireType) {
        case 0:
            return number().has_value();
        case 1:
            return take(8).has_value();
        case 2:
            return delimited().has_value();
        case 5:
            return take(4).has_value();
        case 3:
            break;
        default:
            return false;
        }
        while (depth < 100) {
            const auto key = number();
            if (!key)
                return false;
            const auto inner = static_cast<std::uint32_t>(*key / 8);
            if (*key % 8 == 4)
                return inner == field;
            if (!skip(inner, *key % 8, depth + 1))
                return false;
        }
        return false;
    }

private:
    Bytes bytes_;
};

std::optional<Data> expected(std::string_view name, Bytes bytes);

/// What fields hold so far: the finished entries of each.
using Fields = std::map<std::uint32_t, Data>;

bool readEmbedded(Input& input, Fields& fields, std::uint32_t field, std::string_view kind) {
    const auto bytes = input.delimited();
    const auto inner = bytes ? expected(kind.substr(1, kind.size() - 2), *bytes) : std::nullopt;
    if (!inner)
        return false;
    if (kind.front() == '(')
        fields[field].clear();
    const Data whole = entry(field, 2, *inner, true);
    fields[field].insert(fields[field].end(), whole.begin(), whole.end());
    return true;
}

bool readText(Input& input, Fields& fields, std::uint32_t field, char kind) {
    const auto bytes = input.delimited();
    if (!bytes)
        return false;
    const bool good = kind == 'B' || isUtf8(*bytes);
    const Data whole = good ? entry(field, 2, *bytes, true) : Data();
    if (kind == 'L')
        fields[field].insert(fields[field].end(), whole.begin(), whole.end());
    else if (kind == 's' && !good)
        fields[field] = entry(field, 2, {}, true);
    else
        fields[field] = whole;
    return true;
}

bool readFixed(Input& input, Fields& fields, std::uint32_t field, unsigned size) {
    const auto bytes = input.take(size);
    if (bytes)
        fields[field] = entry(field, size == 8 ? 1 : 5, *bytes, false);
    return bytes.has_value();
}

bool readNumber(Input& input, Fields& fields, std::uint32_t field, char kind) {
    const auto number = input.number();
    if (!number)
        return false;
    std::uint64_t value = *number;
    if (kind == 'i' || kind == 'I')
        value = static_cast<std::uint64_t>(static_cast<std::int64_t>(static_cast<std::int32_t>(value)));
    else if (kind == 'U')
        value %= 1ULL << 32;
    else if (kind == 'b')
        value = value > 0;
    Data bytes;
    appendVarint(bytes, value);
    fields[field] = entry(field, 0, bytes, false);
    return true;
}

bool readField(Input& input, Fields& fields, std::uint32_t field, std::string_view kind) {
    switch (kind.front()) {
    case '(':
    case '[':
        return readEmbedded(input, fields, field, kind);
    case 's':
    case 'S':
    case 'B':
    case 'L':
        return readText(input, fields, field, kind.front());
    case 'd':
    case 'D':
        return readFixed(input, fields, field, 8);
    case 'f':
    case 'F':
        return readFixed(input, fields, field, 4);
    default:
        return readNumber(input, fields, field, kind.front());
    }
}

std::optional<Data> expected(std::string_view name, Bytes bytes) {
    const auto& rows = classes.at(name);
    Fields fields;
    for (const auto& [field, kind] : rows) { // what is required is there from the start
        if (kind == "s")
            fields[field] = entry(field, 2, {}, true);
        else if (kind == "i")
            fields[field] = entry(field, 0, Data(1), false);
        else if (kind == "f")
            fields[field] = entry(field, 5, Data(4), false);
    }
    Input input(bytes);
    while (!input.empty()) {
        const auto key = input.number();
        if (!key)
            return std::nullopt;
        if (*key % 8 == 4)
            break;
        const auto field = static_cast<std::uint32_t>(*key / 8);
        const auto row = rows.find(field);
        const bool good =
            row == rows.end() ? input.skip(field, *key % 8) : readField(input, fields, field, row->second);
        if (!good)
            return std::nullopt;
    }
    Data whole;
    for (const auto& [field, entries] : fields)
        whole.insert(whole.end(), entries.begin(), entries.end());
    return whole;
}

} // namespace

std::optional<Data> expectedEncoding(Bytes envelope) { return expected("envelope", envelope); }

} // namespace tarn
