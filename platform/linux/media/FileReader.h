#pragma once

#include <memory>
#include <optional>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/media/DeadlineCall.h"
#include "platform/linux/media/decoder/ByteSource.h"

namespace tarn {

using SharedFile = std::shared_ptr<const FileDescriptor>;

/// Reads an open regular file by position, with limits on how long that may take. Never waits for a file
/// system of another machine or process beyond the limit.
class FileReader final : public ByteSource {
public:
    /// Each read gives up after `readLimit`, and every one at `deadline` when there is one.
    FileReader(SharedFile file, std::chrono::milliseconds readLimit,
               std::optional<SteadyTime> deadline = std::nullopt);

    std::int64_t size() const override { return size_; }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override;
    bool expired() const override;

private:
    std::int64_t readRemote(std::int64_t offset, std::byte* into, std::size_t size);

    const SharedFile file_;
    const std::chrono::milliseconds readLimit_;
    const std::optional<SteadyTime> deadline_;
    std::int64_t size_ = 0;
    bool remote_ = false;
};

} // namespace tarn
