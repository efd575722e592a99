#pragma once

#include <optional>

#include "decoder/ByteSource.h"
#include "media/DeadlineCall.h"
#include "media/MediaFile.h"

namespace tarn {

/// Reads an open regular file by position. A read of a remote file may take for ever.
class FileReader final : public ByteSource {
public:
    /// With a deadline nothing more is begun behind it.
    explicit FileReader(SharedFile file, std::optional<SteadyTime> deadline = std::nullopt)
        : file_(std::move(file)), deadline_(deadline) {}

    std::int64_t size() const override { return file_->size; }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override;
    bool expired() const override;

private:
    const SharedFile file_;
    const std::optional<SteadyTime> deadline_;
};

} // namespace tarn
