#pragma once

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>

#include "decoder/ByteSource.h"

namespace tarn {

/// A file in memory, on a disk that fails from byte `faultAt` on.
class MemorySource final : public ByteSource {
public:
    explicit MemorySource(std::string bytes, std::size_t faultAt = std::string::npos)
        : bytes_(std::move(bytes)), faultAt_(faultAt) {}

    std::int64_t size() const override { return static_cast<std::int64_t>(bytes_.size()); }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override {
        if (offset >= this->size())
            return 0;
        if (static_cast<std::size_t>(offset) + size > faultAt_)
            return -EIO;
        size = std::min(size, bytes_.size() - static_cast<std::size_t>(offset));
        std::memcpy(into, bytes_.data() + offset, size);
        read_ += static_cast<std::int64_t>(size);
        return static_cast<std::int64_t>(size);
    }

    /// How many bytes were read so far.
    std::int64_t bytesRead() const { return read_; }

private:
    const std::string bytes_;
    const std::size_t faultAt_;
    std::int64_t read_ = 0;
};

} // namespace tarn
