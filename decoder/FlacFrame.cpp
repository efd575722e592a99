#include "decoder/FlacFrame.h"

#include <bit>

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::size_t fixedPart = 4;
constexpr std::size_t streamInfoSize = 34;

bool checkSumHolds(std::string_view header) {
    unsigned sum = 0;
    for (const char byte : header) {
        sum ^= static_cast<unsigned char>(byte);
        for (int bit = 0; bit < 8; ++bit)
            sum = (sum & 0x80) != 0 ? (sum << 1 ^ 7) & 0xFF : sum << 1;
    }
    return sum == 0;
}

// A number in the manner of UTF-8, of up to 36 bits. Takes it off `bytes`.
std::optional<std::int64_t> takeNumber(std::string_view& bytes) {
    const auto first = static_cast<unsigned char>(bytes.empty() ? '\xFF' : bytes.front());
    const int ones = std::countl_one(first);
    const auto size = static_cast<std::size_t>(ones == 0 ? 1 : ones);
    if (ones == 1 || ones == 8 || bytes.size() < size)
        return std::nullopt;
    std::int64_t number = first & (0xFF >> (ones + 1));
    for (std::size_t i = 1; i < size; ++i) {
        if ((byteAt(bytes, i) & 0xC0) != 0x80)
            return std::nullopt;
        number = number << 6 | (byteAt(bytes, i) & 0x3F);
    }
    bytes.remove_prefix(size);
    return ones == 0 ? first : number;
}

} // namespace

std::optional<FlacFrame> FlacFrame::parse(std::string_view bytes, std::int64_t blockSize) {
    if (bytes.size() < fixedPart || byteAt(bytes, 0) != 0xFF || (byteAt(bytes, 1) & 0xFE) != 0xF8)
        return std::nullopt;
    const bool numbersSamples = (byteAt(bytes, 1) & 1) != 0;
    const unsigned sizeCode = byteAt(bytes, 2) >> 4;
    const unsigned rateCode = byteAt(bytes, 2) & 15;
    if (sizeCode == 0 || rateCode == 15 || byteAt(bytes, 3) >> 4 > 10 || (byteAt(bytes, 3) & 1) != 0)
        return std::nullopt;

    std::string_view rest = bytes.substr(fixedPart);
    const auto number = takeNumber(rest);
    const std::size_t sizeBytes = sizeCode == 6 ? 1 : sizeCode == 7 ? 2 : 0;
    const std::size_t rateBytes = rateCode == 12 ? 1 : rateCode == 13 || rateCode == 14 ? 2 : 0;
    if (!number || rest.size() < sizeBytes + rateBytes + 1)
        return std::nullopt;
    const std::size_t header = bytes.size() - rest.size() + sizeBytes + rateBytes + 1;
    if (!checkSumHolds(bytes.substr(0, header)))
        return std::nullopt;

    FlacFrame frame;
    if (sizeBytes > 0)
        frame.samples = static_cast<std::int64_t>(bigEndian(rest.substr(0, sizeBytes))) + 1;
    else if (sizeCode == 1)
        frame.samples = 192;
    else
        frame.samples =
            sizeCode < 6 ? std::int64_t{576} << (sizeCode - 2) : std::int64_t{256} << (sizeCode - 8);
    frame.first = numbersSamples ? *number : *number * blockSize;
    return frame;
}

std::optional<FlacStreamInfo> FlacStreamInfo::parse(std::string_view block) {
    if (block.size() < streamInfoSize)
        return std::nullopt;
    const auto largest = static_cast<std::int64_t>(bigEndian(block.substr(2, 2)));
    const auto samples = static_cast<std::int64_t>(bigEndian(block.substr(13, 5)) & 0xF'FFFF'FFFF);
    return largest > 0 ? std::optional(FlacStreamInfo{largest, samples}) : std::nullopt;
}

} // namespace tarn
