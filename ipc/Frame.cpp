#include "ipc/Frame.h"

#include <algorithm>
#include <cassert>

namespace tarn {

namespace {

constexpr std::size_t kindOffset = 4;
constexpr std::size_t reservedOffset = 5;
constexpr std::size_t callIdOffset = 8;

template <class Integer>
void store(std::span<std::uint8_t> bytes, Integer value) {
    for (std::size_t i = 0; i < sizeof(Integer); ++i)
        bytes[i] = static_cast<std::uint8_t>(value >> (8 * i));
}

template <class Integer>
Integer load(std::span<const std::uint8_t> bytes) {
    Integer value = 0;
    for (std::size_t i = 0; i < sizeof(Integer); ++i)
        value |= static_cast<Integer>(bytes[i]) << (8 * i);
    return value;
}

} // namespace

std::array<std::uint8_t, FrameHeader::size> FrameHeader::encode() const {
    std::array<std::uint8_t, size> bytes{};
    store(std::span(bytes), bodyLength);
    bytes[kindOffset] = static_cast<std::uint8_t>(kind);
    store(std::span(bytes).subspan(callIdOffset), callId);
    return bytes;
}

std::optional<FrameHeader> FrameHeader::decode(std::span<const std::uint8_t, size> bytes) {
    const auto reserved = bytes.subspan<reservedOffset, callIdOffset - reservedOffset>();
    if (std::ranges::any_of(reserved, [](std::uint8_t byte) { return byte != 0; }))
        return std::nullopt;
    return FrameHeader{load<std::uint32_t>(bytes), static_cast<FrameKind>(bytes[kindOffset]),
                       load<std::uint64_t>(bytes.subspan<callIdOffset>())};
}

void appendFrame(Data& bytes, FrameKind kind, std::uint64_t callId, std::span<const std::uint8_t> body) {
    assert(body.size() <= FrameHeader::largestBody);
    const auto header = FrameHeader{static_cast<std::uint32_t>(body.size()), kind, callId}.encode();
    bytes.insert(bytes.end(), header.begin(), header.end());
    bytes.insert(bytes.end(), body.begin(), body.end());
}

} // namespace tarn
