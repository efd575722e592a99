#include "decoder/WavPromise.h"

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::size_t chunkHeader = 8;
constexpr std::size_t firstChunk = 12;
constexpr int mostChunks = 1'000;
constexpr std::uint32_t unknownLength = 0x7FFF0000; // and all above: what writers to pipes put there

} // namespace

std::optional<WavData> findWavData(ByteSource& source) {
    const std::string riff = readPiece(source, 0, firstChunk);
    if (riff.size() < firstChunk || (!riff.starts_with("RIFF") && !riff.starts_with("RF64")) ||
        !riff.ends_with("WAVE"))
        return std::nullopt;
    auto at = static_cast<std::int64_t>(firstChunk);
    for (int i = 0; i < mostChunks; ++i) {
        const std::string chunk = readPiece(source, at, chunkHeader);
        if (chunk.size() < chunkHeader)
            return std::nullopt;
        const auto size = static_cast<std::uint32_t>(littleEndian(std::string_view(chunk).substr(4)));
        at += static_cast<std::int64_t>(chunkHeader);
        if (chunk.starts_with("data"))
            return WavData{at, size};
        at += std::int64_t{size} + (size & 1);
    }
    return std::nullopt;
}

std::optional<std::int64_t> brokenWavPromise(ByteSource& source) {
    const auto data = findWavData(source);
    if (!data || data->size >= unknownLength || data->offset + std::int64_t{data->size} <= source.size())
        return std::nullopt;
    return data->size;
}

} // namespace tarn
