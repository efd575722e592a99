#include "decoder/WavPromise.h"

#include <array>
#include <cstring>

namespace tarn {

namespace {

constexpr std::int64_t chunkHeader = 8;
constexpr std::int64_t firstChunk = 12;
constexpr int mostChunks = 1'000;
constexpr std::uint32_t unknownLength = 0x7FFF0000; // and all above: what writers to pipes put there

bool readExactly(ByteSource& source, std::int64_t offset, char* into, std::size_t size) {
    return source.read(offset, reinterpret_cast<std::byte*>(into), size) == static_cast<std::int64_t>(size);
}

} // namespace

std::optional<std::int64_t> brokenWavPromise(ByteSource& source) {
    std::array<char, firstChunk> riff{};
    if (!readExactly(source, 0, riff.data(), riff.size()) || std::memcmp(riff.data(), "RIFF", 4) != 0 ||
        std::memcmp(riff.data() + 8, "WAVE", 4) != 0)
        return std::nullopt;
    std::int64_t at = firstChunk;
    for (int i = 0; i < mostChunks; ++i) {
        std::array<char, chunkHeader> chunk{};
        if (!readExactly(source, at, chunk.data(), chunk.size()))
            return std::nullopt;
        std::uint32_t size = 0;
        std::memcpy(&size, chunk.data() + 4,
                    sizeof size); // little-endian, like every machine that this runs on
        at += chunkHeader;
        if (std::memcmp(chunk.data(), "data", 4) == 0)
            return size < unknownLength && at + size > source.size() ? std::optional<std::int64_t>(size)
                                                                     : std::nullopt;
        at += size + (size & 1);
    }
    return std::nullopt;
}

} // namespace tarn
