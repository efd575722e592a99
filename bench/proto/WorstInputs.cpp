#include "bench/proto/WorstInputs.h"

#include <initializer_list>

#include "wire/ProtoReader.h"

namespace tarn {

namespace {

constexpr std::size_t longestFrame = 1'048'576;

// Numbers of the fields on the way to what is repeated.
constexpr std::uint32_t plist = 1;
constexpr std::uint32_t audioFilePlayerMessage = 2;
constexpr std::uint32_t playerItem = 2;
constexpr std::uint32_t queuePlayer = 3;
constexpr std::uint32_t setItems = 1;

void putVarint(Data& bytes, std::size_t value) {
    for (; value >= 0x80; value >>= 7)
        bytes.push_back(static_cast<std::uint8_t>(value | 0x80));
    bytes.push_back(static_cast<std::uint8_t>(value));
}

std::uint8_t key(std::uint32_t field, WireType type) {
    return static_cast<std::uint8_t>(field << 3 | static_cast<std::uint8_t>(type));
}

Data field(std::uint32_t number, const Data& content) {
    Data bytes{key(number, WireType::lengthDelimited)};
    putVarint(bytes, content.size());
    bytes.insert(bytes.end(), content.begin(), content.end());
    return bytes;
}

/// `unit` as often as a frame holds it inside the fields of `path`, outermost first.
Data repeated(const Data& unit, std::initializer_list<std::uint32_t> path) {
    constexpr std::size_t longestPrefix = 5;
    const std::size_t room = longestFrame - longestPrefix * path.size();
    Data bytes;
    bytes.reserve(longestFrame);
    while (bytes.size() + unit.size() <= room)
        bytes.insert(bytes.end(), unit.begin(), unit.end());
    for (auto number = std::rbegin(path); number != std::rend(path); ++number)
        bytes = field(*number, bytes);
    return bytes;
}

const Data emptyObject = field(1, {});

/// A property-list value whose key, text and bytes are there and empty.
const Data emptyTextsObject = [] {
    Data texts = field(4, {});
    for (std::uint32_t number : {5U, 13U}) {
        const Data text = field(number, {});
        texts.insert(texts.end(), text.begin(), text.end());
    }
    return field(1, texts);
}();

/// A text with the given length of its own, too long to be kept in place.
Data longText(std::uint32_t number) { return field(number, Data(16, 'x')); }

/// Groups within groups, opened and closed, as deep as they are followed.
Data nestedGroups(std::size_t depth) {
    Data bytes(depth, key(9, WireType::startGroup));
    bytes.resize(2 * depth, key(9, WireType::endGroup));
    return bytes;
}

} // namespace

std::vector<WorstInput> worstInputs() {
    const Data emptyQueuePlayer = field(queuePlayer, field(setItems, field(1, {})));
    return {
        {"empty objects of a property list", repeated(emptyObject, {plist})},
        {"objects with one empty text", repeated(field(1, field(5, {})), {plist})},
        {"objects with three empty texts", repeated(emptyTextsObject, {plist})},
        {"objects with one short text", repeated(field(1, longText(5)), {plist})},
        {"empty strings of a list", repeated(field(2, {}), {audioFilePlayerMessage, queuePlayer, setItems})},
        {"strings of 16 of a list", repeated(longText(2), {audioFilePlayerMessage, queuePlayer, setItems})},
        {"empty embedded messages", repeated(field(audioFilePlayerMessage, {}), {})},
        {"embedded messages, replaced", repeated(emptyQueuePlayer, {audioFilePlayerMessage})},
        {"one text, replaced", repeated(longText(1), {audioFilePlayerMessage, playerItem, 2})},
        {"groups, side by side", repeated(nestedGroups(1), {})},
        {"groups, nested 100 deep", repeated(nestedGroups(100), {})},
        {"groups, never closed", Data(longestFrame, key(9, WireType::startGroup))},
        {"keys without an end", Data(longestFrame, 0xFF)},
        {"unknown fields", repeated({key(9, WireType::varint), 0}, {})},
        {"one text of two-byte characters",
         repeated({0xC3, 0xA9}, {audioFilePlayerMessage, playerItem, 2, 1})},
        {"one text that ends in a broken character",
         [] {
             Data text(longestFrame - 32, 'x');
             text.back() = 0xC3;
             return field(audioFilePlayerMessage, field(playerItem, field(2, field(1, text))));
         }()},
    };
}

} // namespace tarn
