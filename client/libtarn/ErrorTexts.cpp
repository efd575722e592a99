#include "client/libtarn/ErrorTexts.h"

#include <algorithm>
#include <optional>
#include <string_view>

#include "localization/TextEncoding.h"

namespace tarn {

namespace {

using BytesView = std::span<const std::uint8_t>;

constexpr std::string_view magic = "bplist00";
constexpr std::size_t trailerSize = 32;
constexpr unsigned integerType = 1;
constexpr unsigned asciiType = 5;
constexpr unsigned utf16Type = 6;
constexpr unsigned dictionaryType = 13;

std::uint64_t bigEndian(BytesView bytes) {
    std::uint64_t value = 0;
    for (const auto byte : bytes)
        value = value << 8 | byte;
    return value;
}

std::optional<std::string> utf8Of(BytesView utf16) {
    Utf16Joiner joiner;
    std::string text;
    for (std::size_t i = 0; i < utf16.size(); i += 2)
        if (!joiner.add(static_cast<char16_t>(bigEndian(utf16.subspan(i, 2))), text))
            return std::nullopt;
    return joiner.isPending() ? std::nullopt : std::optional(text);
}

/// One object of the list: its type, its count, and everything from its content on.
struct Object {
    unsigned type = 0;
    std::uint64_t count = 0;
    BytesView content;
};

class Reader {
public:
    explicit Reader(BytesView list) : list_(list) {
        const auto trailer = list.last(trailerSize);
        offsetSize_ = trailer[6];
        referenceSize_ = trailer[7];
        objectCount_ = bigEndian(trailer.subspan(8, 8));
        top_ = bigEndian(trailer.subspan(16, 8));
        tableOffset_ = bigEndian(trailer.subspan(24, 8));
    }

    std::map<std::string, std::string> texts() const {
        std::map<std::string, std::string> texts;
        const auto top = object(top_);
        if (!top || top->type != dictionaryType || referenceSize_ == 0 ||
            top->count > top->content.size() / (2 * referenceSize_))
            return texts;
        for (std::uint64_t i = 0; i < top->count; ++i) {
            const auto key = text(reference(*top, i));
            const auto value = text(reference(*top, top->count + i));
            if (key && value)
                texts[*key] = *value;
        }
        return texts;
    }

private:
    /// Lies within `bytes`, as the caller has seen; so nothing is lost where sizes have 32 bits.
    static std::span<const std::uint8_t> part(std::span<const std::uint8_t> bytes, std::uint64_t offset,
                                              std::uint64_t count) {
        return bytes.subspan(static_cast<std::size_t>(offset), static_cast<std::size_t>(count));
    }

    std::uint64_t reference(const Object& dictionary, std::uint64_t index) const {
        return bigEndian(part(dictionary.content, index * referenceSize_, referenceSize_));
    }

    std::optional<Object> object(std::uint64_t index) const {
        const auto body = list_.size() - trailerSize;
        if (index >= objectCount_ || offsetSize_ == 0 || offsetSize_ > 8 || tableOffset_ > body ||
            index >= (body - tableOffset_) / offsetSize_)
            return std::nullopt;
        const auto offset = bigEndian(part(list_, tableOffset_ + index * offsetSize_, offsetSize_));
        if (offset >= body)
            return std::nullopt;
        const auto rest = part(list_, offset, body - offset);
        const unsigned marker = rest.front();
        Object found{marker >> 4U, marker & 0xFU, rest.subspan(1)};
        if (found.count == 0xF && !readLongCount(found))
            return std::nullopt;
        return found;
    }

    /// A count of 15 says that the true one stands in front of the content as an integer.
    static bool readLongCount(Object& object) {
        if (object.content.empty() || object.content[0] >> 4U != integerType)
            return false;
        const auto size = std::size_t{1} << (object.content[0] & 0xFU);
        if (size > 8 || object.content.size() < 1 + size)
            return false;
        object.count = bigEndian(object.content.subspan(1, size));
        object.content = object.content.subspan(1 + size);
        return true;
    }

    static std::optional<std::string> asciiOf(BytesView characters) {
        if (std::ranges::any_of(characters, [](std::uint8_t character) { return character > 0x7F; }))
            return std::nullopt;
        return std::string(characters.begin(), characters.end());
    }

    std::optional<std::string> text(std::uint64_t index) const {
        const auto found = object(index);
        if (found && found->type == asciiType && found->count <= found->content.size())
            return asciiOf(found->content.first(static_cast<std::size_t>(found->count)));
        if (found && found->type == utf16Type && found->count <= found->content.size() / 2)
            return utf8Of(found->content.first(static_cast<std::size_t>(2 * found->count)));
        return std::nullopt;
    }

    BytesView list_;
    std::size_t offsetSize_ = 0;
    std::size_t referenceSize_ = 0;
    std::uint64_t objectCount_ = 0;
    std::uint64_t top_ = 0;
    std::uint64_t tableOffset_ = 0;
};

} // namespace

std::map<std::string, std::string> readErrorTexts(BytesView propertyList) {
    if (propertyList.size() < magic.size() + trailerSize ||
        !std::equal(magic.begin(), magic.end(), propertyList.begin()))
        return {};
    return Reader(propertyList).texts();
}

} // namespace tarn
