#include "platform/linux/media/FileReader.h"

#include <sys/stat.h>
#include <sys/vfs.h>

#include <algorithm>
#include <cerrno>
#include <vector>

namespace tarn {

namespace {

// File systems whose answers come from another machine or process (statfs(2), linux/magic.h).
constexpr std::uint64_t remoteFileSystems[] = {
    0x65735546,                     // FUSE, also document portals
    0x6969,                         // NFS
    0xFF534D42, 0xFE534D42, 0x517B, // CIFS, SMB2, SMB
    0x01021997,                     // 9p
    0x00C36400,                     // Ceph
    0x5346414F,                     // AFS
    0x73757245,                     // Coda
};

bool isRemote(int file) {
    struct statfs status {};
    if (fstatfs(file, &status) != 0)
        return true;
    const auto type = static_cast<std::uint64_t>(status.f_type) & 0xFFFFFFFFu;
    return std::find(std::begin(remoteFileSystems), std::end(remoteFileSystems), type) !=
           std::end(remoteFileSystems);
}

std::int64_t readAt(int file, std::int64_t offset, std::byte* into, std::size_t size) {
    ssize_t count = 0;
    do {
        count = pread(file, into, size, offset);
    } while (count < 0 && errno == EINTR);
    return count < 0 ? -errno : count;
}

} // namespace

FileReader::FileReader(SharedFile file, std::chrono::milliseconds readLimit,
                       std::optional<SteadyTime> deadline)
    : file_(std::move(file)), readLimit_(readLimit), deadline_(deadline), remote_(isRemote(file_->get())) {
    struct stat status {};
    if (fstat(file_->get(), &status) == 0)
        size_ = status.st_size;
}

bool FileReader::expired() const { return deadline_ && std::chrono::steady_clock::now() >= *deadline_; }

std::int64_t FileReader::read(std::int64_t offset, std::byte* into, std::size_t size) {
    if (expired())
        return -ETIMEDOUT;
    return remote_ ? readRemote(offset, into, size) : readAt(file_->get(), offset, into, size);
}

std::int64_t FileReader::readRemote(std::int64_t offset, std::byte* into, std::size_t size) {
    struct Result {
        std::vector<std::byte> bytes;
        std::int64_t count = 0;
    };
    auto result = std::make_shared<Result>();
    result->bytes.resize(size);
    SteadyTime limit = std::chrono::steady_clock::now() + readLimit_;
    if (deadline_)
        limit = std::min(limit, *deadline_);
    const bool inTime = callUntil(limit, [file = file_, result, offset] {
        result->count = readAt(file->get(), offset, result->bytes.data(), result->bytes.size());
    });
    if (!inTime)
        return -ETIMEDOUT;
    if (result->count > 0)
        std::copy_n(result->bytes.begin(), result->count, into);
    return result->count;
}

} // namespace tarn
