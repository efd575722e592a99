#pragma once

#include "decoder/ByteSource.h"
#include "mediaprotocol/Parking.h"

namespace tarn {

/// Reads an open file by position, never from its offset: that is shared with whoever handed it over. A call
/// may take as long as the file system likes.
class FileReader final : public ByteSource {
public:
    /// Without a file every read fails with its error.
    explicit FileReader(ParkedFile file);

    std::int64_t size() const override { return size_; }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override;

private:
    const ParkedFile file_;
    std::int64_t size_ = 0;
};

} // namespace tarn
