#include "decoder/PacketLength.h"

#include <string_view>

#include "decoder/Bytes.h"
#include "decoder/FlacFrame.h"

namespace tarn {

namespace {

constexpr std::size_t alacSettings = 12; // after size, type and version of the atom that they stood in

std::string_view bytesOf(const std::uint8_t* bytes, int size) {
    return {reinterpret_cast<const char*>(bytes), static_cast<std::size_t>(size)};
}

std::optional<std::int64_t> numberAt(std::string_view bytes, std::size_t at, bool little) {
    if (bytes.size() < at + 4)
        return std::nullopt;
    const std::string_view digits = bytes.substr(at, 4);
    return static_cast<std::int64_t>(little ? littleEndian(digits) : bigEndian(digits));
}

// Behind 3 + 4 + 12 bits about the channels comes one that says that this is a short packet, and after three
// more the number of its samples.
std::optional<std::int64_t> alacFrames(std::string_view settings, std::string_view packet) {
    if (packet.size() < 7)
        return std::nullopt;
    const std::uint64_t start = bigEndian(packet.substr(0, 7));
    if ((start >> (56 - 20) & 1) != 0)
        return static_cast<std::int64_t>(start >> (56 - 55) & 0xFFFF'FFFF);
    return numberAt(settings, alacSettings, false);
}

// A configuration of five bits gives the length of one frame; two bits and perhaps a count tell how many.
std::optional<std::int64_t> opusFrames(std::string_view packet) {
    if (packet.empty())
        return std::nullopt;
    const auto first = static_cast<unsigned char>(packet[0]);
    const int configuration = first >> 3;
    std::int64_t length = 0;
    if (configuration < 12)
        length = (configuration & 3) == 3 ? 2880 : std::int64_t{480} << (configuration & 3);
    else if (configuration < 16)
        length = std::int64_t{480} << (configuration & 1);
    else
        length = std::int64_t{120} << (configuration & 3);
    if ((first & 3) == 3)
        return packet.size() < 2 ? std::nullopt : std::optional(length * (packet[1] & 0x3F));
    return (first & 3) == 0 ? length : 2 * length;
}

} // namespace

std::optional<std::int64_t> framesIn(const AVStream& stream, const AVPacket& packet) {
    AVCodecParameters& parameters = *stream.codecpar;
    const std::string_view bytes = bytesOf(packet.data, packet.size);
    switch (parameters.codec_id) {
    case AV_CODEC_ID_FLAC:
        if (const auto frame = FlacFrame::parse(bytes, 0))
            return frame->samples;
        return std::nullopt;
    case AV_CODEC_ID_ALAC:
        return alacFrames(bytesOf(parameters.extradata, parameters.extradata_size), bytes);
    case AV_CODEC_ID_WAVPACK:
        return numberAt(bytes, 20, true);
    case AV_CODEC_ID_OPUS:
        return opusFrames(bytes);
    case AV_CODEC_ID_VORBIS: // of two block sizes, one after the other
        return std::nullopt;
    default:
        break;
    }
    if (parameters.frame_size > 0)
        return parameters.frame_size;
    const int frames = av_get_audio_frame_duration2(&parameters, packet.size);
    return frames > 0 ? std::optional<std::int64_t>(frames) : std::nullopt;
}

} // namespace tarn
