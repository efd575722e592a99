#include "decoder/Id3.h"

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::int64_t headerSize = 10;
constexpr int mostTags = 8;

// Four bytes of seven bits each, so that they cannot be taken for the beginning of a frame of audio.
std::int64_t synchsafe(std::string_view digits) {
    std::int64_t value = 0;
    for (const char digit : digits)
        value = value << 7 | (static_cast<unsigned char>(digit) & 0x7F);
    return value;
}

} // namespace

std::optional<Id3Tag> Id3Tag::at(ByteSource& source, std::int64_t offset) {
    const std::string header = readPiece(source, offset, headerSize);
    if (header.size() < headerSize || header.compare(0, 3, "ID3") != 0 || header[3] < 2 || header[3] > 4)
        return std::nullopt;
    const auto flags = static_cast<unsigned char>(header[5]);
    Id3Tag tag;
    tag.version = static_cast<unsigned char>(header[3]);
    tag.extended = tag.version > 2 && (flags & 0x40) != 0;
    tag.begin = offset;
    tag.end = offset + headerSize + synchsafe(std::string_view(header).substr(6));
    tag.next = tag.end + (tag.version == 4 && (flags & 0x10) != 0 ? headerSize : 0);
    return tag;
}

std::int64_t endOfId3Tags(ByteSource& source) {
    std::int64_t end = 0;
    for (int i = 0; i < mostTags; ++i) {
        const auto tag = Id3Tag::at(source, end);
        if (!tag)
            break;
        end = tag->next;
    }
    return end;
}

} // namespace tarn
