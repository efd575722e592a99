#include "wire/ProtoReader.h"

#include <array>
#include <bit>
#include <cstring>
#include <limits>

namespace tarn {

static_assert(std::endian::native == std::endian::little,
              "numbers are copied from and to the wire as they are");

namespace {

constexpr unsigned longestVarint = 10;
constexpr std::size_t deepestGroup = 100;

} // namespace

ProtoReader::ProtoReader(std::span<const std::uint8_t> bytes) noexcept
    : bytes_(bytes.data()),
      length_(static_cast<std::uint32_t>(bytes.size())),
      error_(bytes.size() > std::numeric_limits<std::uint32_t>::max()) {}

std::uint64_t ProtoReader::readLongVarint() noexcept {
    if (error_)
        return 0;
    std::uint64_t value = 0;
    for (unsigned index = 0; index < longestVarint; ++index) {
        if (position_ >= length_) {
            error_ = true;
            return 0;
        }
        const std::uint8_t byte = bytes_[position_++];
        value |= static_cast<std::uint64_t>(byte & 0x7F) << (7 * index);
        if (byte < 0x80)
            return value;
    }
    return 0;
}

template <class Number>
Number ProtoReader::readFixed() noexcept {
    const std::uint32_t start = position_;
    if (!skipBytes(sizeof(Number)))
        return 0;
    Number number = 0;
    std::memcpy(&number, bytes_ + start, sizeof number);
    return number;
}

double ProtoReader::readDouble() noexcept { return readFixed<double>(); }

float ProtoReader::readFloat() noexcept { return readFixed<float>(); }

bool ProtoReader::skipValue(std::uint32_t fieldNumber, WireType wireType) noexcept {
    switch (wireType) {
    case WireType::varint:
        readVarint();
        return !error_;
    case WireType::fixed64:
        return skipBytes(sizeof(std::uint64_t));
    case WireType::lengthDelimited:
        return skipBytes(readVarint());
    case WireType::startGroup:
        return skipGroup(fieldNumber);
    case WireType::fixed32:
        return skipBytes(sizeof(std::uint32_t));
    case WireType::endGroup:
        break;
    }
    return false;
}

/// Groups nest as deep as the sender likes, so what is open is kept here and not on the call stack.
bool ProtoReader::skipGroup(std::uint32_t fieldNumber) noexcept {
    std::array<std::uint32_t, deepestGroup> open;
    std::size_t depth = 0;
    open[depth++] = fieldNumber;
    while (depth > 0) {
        const ProtoKey key(readVarint());
        if (error_)
            return false;
        if (key.wireType == WireType::startGroup) {
            if (depth == deepestGroup)
                return false;
            open[depth++] = key.fieldNumber;
        } else if (key.wireType == WireType::endGroup) {
            if (open[--depth] != key.fieldNumber)
                return false;
        } else if (!skipValue(key.fieldNumber, key.wireType)) {
            return false;
        }
    }
    return true;
}

} // namespace tarn
