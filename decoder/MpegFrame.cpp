#include "decoder/MpegFrame.h"

#include <array>

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::size_t mpegHeader = 4;
constexpr std::size_t adtsHeader = 7;

// In kbit/s, by bitrate index. Rows: version 1 layers I, II, III; versions 2 and 2.5 layer I, layers II and
// III.
constexpr int bitrates[5][15] = {
    {0, 32, 64, 96, 128, 160, 192, 224, 256, 288, 320, 352, 384, 416, 448},
    {0, 32, 48, 56, 64, 80, 96, 112, 128, 160, 192, 224, 256, 320, 384},
    {0, 32, 40, 48, 56, 64, 80, 96, 112, 128, 160, 192, 224, 256, 320},
    {0, 32, 48, 56, 64, 80, 96, 112, 128, 144, 160, 176, 192, 224, 256},
    {0, 8, 16, 24, 32, 40, 48, 56, 64, 80, 96, 112, 128, 144, 160},
};
constexpr int mpegRates[3] = {44'100, 48'000, 32'000};
constexpr int adtsRates[13] = {96'000, 88'200, 64'000, 48'000, 44'100, 32'000, 24'000,
                               22'050, 16'000, 12'000, 11'025, 8'000,  7'350};

std::optional<MpegFrame> parseAdts(std::string_view bytes) {
    const unsigned rate = byteAt(bytes, 2) >> 2 & 15;
    if (bytes.size() < adtsHeader || rate >= std::size(adtsRates))
        return std::nullopt;
    const std::size_t size = (byteAt(bytes, 3) & 3) << 11 | byteAt(bytes, 4) << 3 | byteAt(bytes, 5) >> 5;
    const int blocks = static_cast<int>(byteAt(bytes, 6) & 3) + 1;
    if (size < adtsHeader)
        return std::nullopt;
    return MpegFrame{MpegFrame::Kind::adts, size, blocks * 1024, adtsRates[rate]};
}

} // namespace

std::optional<MpegFrame> MpegFrame::parse(std::string_view bytes) {
    if (bytes.size() < mpegHeader || byteAt(bytes, 0) != 0xFF || (byteAt(bytes, 1) & 0xE0) != 0xE0)
        return std::nullopt;
    const unsigned layerBits = byteAt(bytes, 1) >> 1 & 3;
    const unsigned versionBits = byteAt(bytes, 1) >> 3 & 3;
    if (layerBits == 0)
        return (versionBits & 2) != 0 ? parseAdts(bytes) : std::nullopt;
    const unsigned bitrate = byteAt(bytes, 2) >> 4;
    const unsigned rate = byteAt(bytes, 2) >> 2 & 3;
    if (versionBits == 1 || bitrate == 0 || bitrate == 15 || rate == 3)
        return std::nullopt;

    const unsigned layer = 4 - layerBits;
    const bool version1 = versionBits == 3;
    MpegFrame frame;
    frame.kind = static_cast<Kind>(layer - 1);
    frame.rate = mpegRates[rate] >> (version1 ? 0 : versionBits == 2 ? 1 : 2);
    frame.samples = layer == 1 ? 384 : layer == 3 && !version1 ? 576 : 1152;
    const int* const row = version1 ? bitrates[layer - 1] : bitrates[layer == 1 ? 3 : 4];
    const std::size_t slot = layer == 1 ? 4 : 1; // bytes come in slots
    const auto bits = static_cast<std::size_t>(row[bitrate]) * 1000;
    const std::size_t slots =
        static_cast<std::size_t>(frame.samples) / 8 * bits / static_cast<std::size_t>(frame.rate) / slot;
    frame.bytes = (slots + (byteAt(bytes, 2) >> 1 & 1)) * slot;
    return frame;
}

MpegFrameRun readMpegFrames(std::string_view bytes) {
    MpegFrameRun run;
    std::optional<MpegFrame> first;
    while (run.bytes < bytes.size()) {
        const auto frame = MpegFrame::parse(bytes.substr(run.bytes));
        if (!frame || (first && !first->matches(*frame)))
            break;
        first = first ? first : frame;
        ++run.frames;
        run.bytes += frame->bytes;
        run.samples += frame->samples;
    }
    return run;
}

} // namespace tarn
