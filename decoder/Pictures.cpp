#include "decoder/Pictures.h"

#include <cstring>

#include "decoder/Bytes.h"
#include "decoder/Container.h"
#include "decoder/Id3.h"
#include "decoder/Mp4Atoms.h"

namespace tarn {

namespace {

constexpr int mostFrames = 1'000;
constexpr int mostId3Tags = 8;
constexpr std::int64_t largestPicture = 4 << 20;

// Frames of an ID3 tag that hold pictures and other files.
bool isBulky(std::string_view name) {
    for (const std::string_view bulky : {"APIC", "PIC", "GEOB", "GEO", "PRIV"})
        if (name == bulky)
            return true;
    return false;
}

bool isFrameName(std::string_view name) {
    for (const char letter : name)
        if ((letter < 'A' || letter > 'Z') && (letter < '0' || letter > '9'))
            return false;
    return !name.empty();
}

// Version 4 means seven bits in each byte of a size, but some taggers went on to write eight; what follows
// tells.
std::int64_t frameSize(ByteSource& source, const Id3Tag& tag, std::int64_t at, std::string_view header) {
    if (tag.version == 2)
        return static_cast<std::int64_t>(bigEndian(header.substr(3, 3)));
    const auto size = static_cast<std::int64_t>(bigEndian(header.substr(4, 4)));
    if (tag.version == 3 || size <= 0x7F)
        return size;
    const std::int64_t synchsafe =
        (size & 0x7F) | (size & 0x7F00) >> 1 | (size & 0x7F'0000) >> 2 | (size & 0x7F00'0000) >> 3;
    const std::int64_t next = at + 10 + synchsafe;
    const std::string name = readPiece(source, next, 4);
    return next >= tag.end || isFrameName(name) || name == std::string(4, '\0') ? synchsafe : size;
}

void hideInTag(ByteSource& source, const Id3Tag& tag, std::int64_t largest, std::vector<Patch>& patches) {
    const std::size_t nameSize = tag.version == 2 ? 3 : 4;
    const std::int64_t headerSize = tag.version == 2 ? 6 : 10;
    std::int64_t at = tag.begin + 10;
    for (int i = 0; i < mostFrames && !tag.extended && at + headerSize < tag.end; ++i) {
        const std::string header = readPiece(source, at, static_cast<std::size_t>(headerSize));
        if (header.size() < static_cast<std::size_t>(headerSize) || !isFrameName(header.substr(0, nameSize)))
            break;
        const std::int64_t size = frameSize(source, tag, at, header);
        if (isBulky(header.substr(0, nameSize)) && size > largest)
            patches.push_back({at, "X"});
        at += headerSize + size;
    }
}

void hideInFlac(ByteSource& source, std::int64_t at, std::int64_t largest, std::vector<Patch>& patches) {
    constexpr char padding = 1;
    constexpr char picture = 6;
    at += 4; // "fLaC"
    for (int i = 0; i < mostFrames; ++i) {
        const std::string header = readPiece(source, at, 4);
        if (header.size() < 4)
            break;
        const bool last = (header[0] & 0x80) != 0;
        const auto size = static_cast<std::int64_t>(bigEndian(std::string_view(header).substr(1)));
        if ((header[0] & 0x7F) == picture && size > largest)
            patches.push_back({at, std::string(1, static_cast<char>((header[0] & 0x80) | padding))});
        if (last)
            break;
        at += 4 + size;
    }
}

void hideInMp4(ByteSource& source, std::int64_t largest, std::vector<Patch>& patches) {
    const auto list = findAtom(source, {"moov", "udta", "meta", "ilst"});
    if (!list)
        return;
    visitAtoms(source, list->payload, list->end, [&](const Mp4Atom& atom) {
        if (atom.type == "covr" && atom.end - atom.begin > largest)
            patches.push_back({atom.typeOffset(), "free"});
        return true;
    });
}

const char* mimeTypeOf(AVCodecID codec) {
    switch (codec) {
    case AV_CODEC_ID_MJPEG:
        return "image/jpeg";
    case AV_CODEC_ID_PNG:
        return "image/png";
    case AV_CODEC_ID_GIF:
        return "image/gif";
    case AV_CODEC_ID_BMP:
        return "image/bmp";
    case AV_CODEC_ID_WEBP:
        return "image/webp";
    default:
        return nullptr;
    }
}

bool isFront(const AVStream& stream) {
    const AVDictionaryEntry* kind = av_dict_get(stream.metadata, "comment", nullptr, 0);
    return kind != nullptr && std::strcmp(kind->value, "Cover (front)") == 0;
}

} // namespace

std::vector<Patch> hidePictures(ByteSource& source, std::int64_t largest) {
    std::vector<Patch> patches;
    std::int64_t at = 0;
    for (int i = 0; i < mostId3Tags; ++i) {
        const auto tag = Id3Tag::at(source, at);
        if (!tag)
            break;
        hideInTag(source, *tag, largest, patches);
        at = tag->next;
    }
    const std::string head = readPiece(source, at, 8);
    if (head.starts_with("fLaC"))
        hideInFlac(source, at, largest, patches);
    else if (head.ends_with("ftyp"))
        hideInMp4(source, largest, patches);
    return patches;
}

std::optional<Picture> readPicture(ByteSource& source) {
    Container container;
    if (container.openHeader(source, largestPicture))
        return std::nullopt;
    const AVStream* chosen = nullptr;
    for (unsigned i = 0; i < container.context().nb_streams; ++i) {
        const AVStream& stream = *container.context().streams[i];
        if (stream.attached_pic.size <= 0 || stream.attached_pic.size > largestPicture ||
            mimeTypeOf(stream.codecpar->codec_id) == nullptr)
            continue;
        if (chosen == nullptr || (isFront(stream) && !isFront(*chosen)))
            chosen = &stream;
    }
    if (chosen == nullptr)
        return std::nullopt;
    const auto* begin = reinterpret_cast<const std::byte*>(chosen->attached_pic.data);
    return Picture{{begin, begin + chosen->attached_pic.size}, mimeTypeOf(chosen->codecpar->codec_id)};
}

} // namespace tarn
