#include "decoder/VorbisComments.h"

#include <algorithm>

#include "decoder/Bytes.h"
#include "decoder/Id3.h"

namespace tarn {

namespace {

constexpr std::size_t longestBlock = std::size_t{64} * 1024; // what lies behind it are pictures
constexpr int mostPages = 64;
constexpr int mostBlocks = 1'000;

std::string flacComments(ByteSource& source, std::int64_t at) {
    constexpr char comments = 4;
    at += 4; // "fLaC"
    for (int i = 0; i < mostBlocks; ++i) {
        const std::string header = readPiece(source, at, 4);
        if (header.size() < 4)
            break;
        const auto size = bigEndian(std::string_view(header).substr(1));
        if ((header[0] & 0x7F) == comments)
            return readPiece(source, at + 4,
                             static_cast<std::size_t>(std::min<std::uint64_t>(size, longestBlock)));
        if ((header[0] & 0x80) != 0) // the last one
            break;
        at += 4 + static_cast<std::int64_t>(size);
    }
    return {};
}

/// A page of an Ogg file: a part of one of the streams in it.
struct OggPage {
    std::uint64_t stream = 0;
    std::int64_t payload = 0;
    std::int64_t end = 0;
    std::size_t firstPacket = 0; ///< bytes of the first packet on it
    bool ended = false;          ///< that packet ends here

    static std::optional<OggPage> at(ByteSource& source, std::int64_t offset) {
        constexpr std::size_t headerSize = 27;
        const std::string header = readPiece(source, offset, headerSize);
        if (header.size() < headerSize || !header.starts_with("OggS"))
            return std::nullopt;
        const std::string sizes = readPiece(source, offset + static_cast<std::int64_t>(headerSize),
                                            static_cast<unsigned char>(header[26]));
        OggPage page;
        page.stream = littleEndian(std::string_view(header).substr(14, 4));
        page.payload = page.end = offset + static_cast<std::int64_t>(headerSize + sizes.size());
        for (const char segment : sizes) {
            const auto size = static_cast<unsigned char>(segment);
            page.end += size;
            page.firstPacket += page.ended ? 0 : size;
            page.ended = page.ended || size < 255;
        }
        return page;
    }
};

// What the first and the second packet of a stream begin with, and how much of the second is no comment.
struct OggCodec {
    std::string_view first;
    std::string_view second;
    std::size_t skipped;
};
constexpr OggCodec oggCodecs[] = {
    {"\1vorbis", "\3vorbis", 7}, {"OpusHead", "OpusTags", 8}, {"\177FLAC", "", 4}};

// They are the second packet of a stream, which begins on a page of its own and may go on over many.
std::string oggComments(ByteSource& source) {
    const OggCodec* codec = nullptr;
    std::uint64_t stream = 0;
    std::string packet;
    std::int64_t at = 0;
    for (int i = 0; i < mostPages && packet.size() < longestBlock; ++i) {
        const auto page = OggPage::at(source, at);
        if (!page)
            break;
        if (codec == nullptr) {
            const std::string start = readPiece(source, page->payload, 8);
            for (const OggCodec& known : oggCodecs)
                if (start.starts_with(known.first))
                    codec = &known;
            stream = page->stream;
        } else if (page->stream == stream) {
            packet += readPiece(source, page->payload, page->firstPacket);
            if (page->ended)
                break;
        }
        at = page->end;
    }
    if (codec == nullptr || !packet.starts_with(codec->second))
        return {};
    return packet.substr(std::min(packet.size(), codec->skipped));
}

bool equalsIgnoringCase(std::string_view one, std::string_view other) {
    const auto upper = [](char letter) {
        return letter >= 'a' && letter <= 'z' ? static_cast<char>(letter - 'a' + 'A') : letter;
    };
    return std::ranges::equal(one, other, {}, upper, upper);
}

/// Takes a text with its length in front off `rest`; none when it is cut short.
std::optional<std::string_view> takeText(std::string_view& rest) {
    if (rest.size() < 4)
        return std::nullopt;
    const auto size = static_cast<std::size_t>(littleEndian(rest.substr(0, 4)));
    rest.remove_prefix(4);
    if (size > rest.size())
        return std::nullopt;
    const std::string_view text = rest.substr(0, size);
    rest.remove_prefix(size);
    return text;
}

} // namespace

VorbisComments::VorbisComments(ByteSource& source) {
    const std::int64_t start = endOfId3Tags(source);
    const std::string signature = readPiece(source, start, 4);
    if (signature == "fLaC")
        block_ = flacComments(source, start);
    else if (signature == "OggS")
        block_ = oggComments(source);
}

std::optional<std::string> VorbisComments::first(std::string_view key) const {
    std::string_view rest = block_;
    if (!takeText(rest) || rest.size() < 4) // the program that wrote them, and their number
        return std::nullopt;
    rest.remove_prefix(4);
    while (const auto comment = takeText(rest)) {
        const std::size_t equals = comment->find('=');
        if (equals != comment->npos && equals + 1 < comment->size() &&
            equalsIgnoringCase(comment->substr(0, equals), key))
            return std::string(comment->substr(equals + 1));
    }
    return std::nullopt;
}

} // namespace tarn
