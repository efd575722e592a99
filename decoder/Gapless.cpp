#include "decoder/Gapless.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <string>

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::int64_t longestFrame = 2881; // of MPEG layer 3, in bytes
constexpr std::int64_t longestDelay = 1 << 16;

std::optional<std::uint64_t> nextHexWord(std::string_view& text) {
    while (!text.empty() && text.front() == ' ')
        text.remove_prefix(1);
    std::uint64_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value, 16);
    if (error != std::errc())
        return std::nullopt;
    text.remove_prefix(static_cast<std::size_t>(end - text.data()));
    return value;
}

bool plausible(const GaplessTag& tag) {
    return tag.delay >= 0 && tag.delay <= longestDelay && tag.padding >= 0 && tag.padding <= longestDelay &&
           (!tag.recording || (*tag.recording > 0 && *tag.recording < (std::int64_t{1} << 48)));
}

// The optional fields of the frame (frame count, byte count, table of contents, quality) precede the
// encoder's.
std::size_t encoderFieldOffset(std::uint32_t flags) {
    return 8u + ((flags & 1) ? 4u : 0u) + ((flags & 2) ? 4u : 0u) + ((flags & 4) ? 100u : 0u) +
           ((flags & 8) ? 4u : 0u);
}

} // namespace

std::optional<GaplessTag> parseITunSMPB(std::string_view text) {
    std::array<std::uint64_t, 4> words{};
    for (std::uint64_t& word : words) {
        const auto next = nextHexWord(text);
        if (!next)
            return std::nullopt;
        word = *next;
    }
    GaplessTag tag{static_cast<std::int64_t>(words[1]), static_cast<std::int64_t>(words[2]),
                   static_cast<std::int64_t>(words[3])};
    return plausible(tag) ? std::optional(tag) : std::nullopt;
}

std::optional<GaplessTag> readLameTag(ByteSource& source, std::int64_t firstPacket) {
    const std::int64_t start = std::max<std::int64_t>(0, firstPacket - longestFrame);
    std::string bytes(static_cast<std::size_t>(std::max<std::int64_t>(0, firstPacket - start)), '\0');
    const std::int64_t count = source.read(start, reinterpret_cast<std::byte*>(bytes.data()), bytes.size());
    if (count != static_cast<std::int64_t>(bytes.size()))
        return std::nullopt;

    const std::string_view text = bytes;
    std::size_t mark = text.rfind("Xing");
    if (mark == std::string_view::npos)
        mark = text.rfind("Info");
    if (mark == std::string_view::npos || mark + 8 > text.size())
        return std::nullopt;
    const auto byteAt = [&](std::size_t at) {
        return static_cast<std::uint32_t>(static_cast<unsigned char>(text[at]));
    };
    const std::size_t encoder = mark + encoderFieldOffset(byteAt(mark + 7));
    if (encoder + 24 > text.size())
        return std::nullopt;
    const std::string_view name = text.substr(encoder, 4);
    if (name != "LAME" && name != "Lavf" && name != "Lavc")
        return std::nullopt;
    const std::uint32_t field = byteAt(encoder + 21) << 16 | byteAt(encoder + 22) << 8 | byteAt(encoder + 23);
    return GaplessTag{field >> 12, field & 0xFFF, std::nullopt};
}

std::optional<GaplessTag> readCafTable(ByteSource& source) {
    constexpr std::int64_t fileHeader = 8;
    constexpr std::int64_t chunkHeader = 12; // a name and a size
    constexpr int mostChunks = 1'000;
    std::int64_t at = fileHeader;
    for (int i = 0; i < mostChunks; ++i) {
        const std::string chunk = readPiece(source, at, chunkHeader + 24);
        const std::string_view view = chunk;
        if (chunk.size() < chunkHeader + 24)
            return std::nullopt;
        if (view.starts_with("pakt")) { // after the number of packets
            const GaplessTag tag{static_cast<std::int64_t>(bigEndian(view.substr(28, 4))),
                                 static_cast<std::int64_t>(bigEndian(view.substr(32, 4))),
                                 static_cast<std::int64_t>(bigEndian(view.substr(20, 8)))};
            return plausible(tag) ? std::optional(tag) : std::nullopt;
        }
        const auto size = static_cast<std::int64_t>(bigEndian(view.substr(4, 8)));
        if (size < 0 || size > source.size() - at) // the last chunk may not know its size
            return std::nullopt;
        at += chunkHeader + size;
    }
    return std::nullopt;
}

std::int64_t endOfRecording(std::int64_t end, std::int64_t first, const GaplessTag& tag, AVCodecID codec) {
    if (tag.recording)
        return std::min(end, first + *tag.recording);
    if (codec == AV_CODEC_ID_MP3)
        return end - std::max<std::int64_t>(0, tag.padding - mp3DecoderDelay);
    return end;
}

std::optional<GaplessTag> readGaplessTag(const Container& container, ByteSource& source,
                                         std::int64_t firstPacket) {
    for (const AVDictionary* dictionary : {container.context().metadata, container.stream().metadata})
        if (const AVDictionaryEntry* entry = av_dict_get(dictionary, "iTunSMPB", nullptr, 0))
            if (auto tag = parseITunSMPB(entry->value))
                return tag;
    if (container.isNamed("caf"))
        return readCafTable(source);
    if (container.stream().codecpar->codec_id == AV_CODEC_ID_MP3 && firstPacket > 0)
        return readLameTag(source, firstPacket);
    return std::nullopt;
}

} // namespace tarn
