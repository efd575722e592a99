#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn {

/// The bytes of an open file. Used by one thread at a time.
class ByteSource {
public:
    virtual ~ByteSource() = default;

    virtual std::int64_t size() const = 0;

    /// Reads up to `size` bytes at `offset`. Returns how many; 0 at the end; a negative errno when the file
    /// cannot be read. May wait as long as the file's system likes.
    virtual std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) = 0;
};

} // namespace tarn
