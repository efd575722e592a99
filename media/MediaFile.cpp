#include "media/MediaFile.h"

#include <sys/stat.h>
#include <sys/vfs.h>

#include <algorithm>
#include <utility>

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

} // namespace

MediaFile::MediaFile(FileDescriptor opened) : descriptor(std::move(opened)) {
    struct stat status {};
    if (fstat(descriptor.get(), &status) != 0)
        return;
    size = status.st_size;
    regular = S_ISREG(status.st_mode);
    remote = regular && isRemote(descriptor.get());
}

} // namespace tarn
