#include "decoder/Bytes.h"

namespace tarn {

std::string readPiece(ByteSource& source, std::int64_t offset, std::size_t size) {
    std::string piece(size, '\0');
    std::size_t have = 0;
    while (have < size && offset >= 0) {
        const std::int64_t count =
            source.read(offset + static_cast<std::int64_t>(have),
                        reinterpret_cast<std::byte*>(piece.data()) + have, size - have);
        if (count <= 0)
            break;
        have += static_cast<std::size_t>(count);
    }
    piece.resize(have);
    return piece;
}

std::uint64_t bigEndian(std::string_view digits) {
    std::uint64_t value = 0;
    for (const char digit : digits)
        value = value << 8 | static_cast<unsigned char>(digit);
    return value;
}

std::uint64_t littleEndian(std::string_view digits) {
    std::uint64_t value = 0;
    for (auto digit = digits.rbegin(); digit != digits.rend(); ++digit)
        value = value << 8 | static_cast<unsigned char>(*digit);
    return value;
}

} // namespace tarn
