#include "wire/PropertyList.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <string_view>
#include <vector>

#include "wire/Utf8.h"

namespace tarn {

namespace {

// The file: "bplist00", the objects, the offset of each object, and a trailer that says where those offsets
// are. All numbers are big-endian. An object begins with a byte of its kind and its count.

constexpr std::uint8_t integerKind = 0x10;
constexpr std::uint8_t asciiTextKind = 0x50;
constexpr std::uint8_t utf16TextKind = 0x60;
constexpr std::uint8_t dictionaryKind = 0xD0;
constexpr std::uint8_t countFollows = 0x0F;

/// The width of a number in bytes: 1, 2, 4 or 8.
std::uint8_t widthFor(std::uint64_t highest) {
    const auto bytes = (std::bit_width(highest | 1) + 7) / 8;
    return static_cast<std::uint8_t>(std::bit_ceil(static_cast<unsigned>(bytes)));
}

std::u16string utf16FromUtf8(std::string_view text) {
    std::u16string units;
    while (!text.empty()) {
        const std::size_t length = utf8CharacterLength(text);
        const char32_t character = utf8CharacterValue(text, length);
        if (character < 0x10000) {
            units.push_back(static_cast<char16_t>(character));
        } else {
            units.push_back(static_cast<char16_t>(0xD800 + ((character - 0x10000) >> 10)));
            units.push_back(static_cast<char16_t>(0xDC00 + ((character - 0x10000) & 0x3FF)));
        }
        text.remove_prefix(length);
    }
    return units;
}

class BinaryWriter {
public:
    Data write(const std::map<std::string, std::string>& dictionary) {
        constexpr std::string_view magic = "bplist00";
        bytes_.assign(magic.begin(), magic.end());
        const std::size_t objectCount = 1 + 2 * dictionary.size();
        const std::uint8_t referenceWidth = widthFor(objectCount - 1);
        putDictionary(dictionary.size(), referenceWidth);
        for (const auto& [key, value] : dictionary)
            putText(key);
        for (const auto& [key, value] : dictionary)
            putText(value);
        putOffsets(referenceWidth);
        return std::move(bytes_);
    }

private:
    /// The dictionary is object 0; the keys follow it, then the values.
    void putDictionary(std::size_t entryCount, std::uint8_t referenceWidth) {
        beginObject(dictionaryKind, entryCount);
        for (std::size_t object = 1; object <= 2 * entryCount; ++object)
            putNumber(object, referenceWidth);
    }

    void putText(std::string_view text) {
        const bool ascii =
            std::ranges::all_of(text, [](char c) { return static_cast<unsigned char>(c) < 0x80; });
        if (ascii) {
            beginObject(asciiTextKind, text.size());
            bytes_.insert(bytes_.end(), text.begin(), text.end());
            return;
        }
        const std::u16string units = utf16FromUtf8(text);
        beginObject(utf16TextKind, units.size());
        for (const char16_t unit : units)
            putNumber(unit, 2);
    }

    void beginObject(std::uint8_t kind, std::size_t count) {
        offsets_.push_back(bytes_.size());
        if (count < countFollows) {
            bytes_.push_back(static_cast<std::uint8_t>(kind | count));
            return;
        }
        const std::uint8_t width = widthFor(count);
        bytes_.push_back(kind | countFollows);
        bytes_.push_back(static_cast<std::uint8_t>(integerKind | std::countr_zero(width)));
        putNumber(count, width);
    }

    void putOffsets(std::uint8_t referenceWidth) {
        const std::size_t offsetTable = bytes_.size();
        const std::uint8_t offsetWidth = widthFor(offsetTable);
        for (const std::size_t offset : offsets_)
            putNumber(offset, offsetWidth);
        bytes_.insert(bytes_.end(), 6, 0);
        bytes_.push_back(offsetWidth);
        bytes_.push_back(referenceWidth);
        putNumber(offsets_.size(), 8);
        putNumber(0, 8); // the top object
        putNumber(offsetTable, 8);
    }

    void putNumber(std::uint64_t number, unsigned width) {
        for (unsigned shift = 8 * width; shift > 0; shift -= 8)
            bytes_.push_back(static_cast<std::uint8_t>(number >> (shift - 8)));
    }

    Data bytes_;
    std::vector<std::size_t> offsets_;
};

} // namespace

PropertyListOutcome binaryPropertyList(const std::map<std::string, std::string>& dictionary) {
    for (const auto& [key, value] : dictionary) {
        if (!isValidUtf8(key) || !isValidUtf8(value))
            return {std::nullopt,
                    Error{"PropertyList", 1, {{localizedDescriptionKey, "a text is not UTF-8"}}}};
    }
    return {BinaryWriter().write(dictionary), {}};
}

} // namespace tarn
