#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "decoder/ByteSource.h"

namespace tarn {

/// `size` bytes of a file from `offset` on; fewer where it ends or cannot be read.
std::string readPiece(ByteSource& source, std::int64_t offset, std::size_t size);

/// The byte at place `at`, which must be one of `bytes`, as a number.
inline unsigned byteAt(std::string_view bytes, std::size_t at) {
    return static_cast<unsigned char>(bytes[at]);
}

/// The number whose digits are the (at most eight) bytes of `digits`, the most significant first.
std::uint64_t bigEndian(std::string_view digits);

/// The same with the least significant first.
std::uint64_t littleEndian(std::string_view digits);

} // namespace tarn
