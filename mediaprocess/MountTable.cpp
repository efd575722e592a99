#include "mediaprocess/MountTable.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>

#include <algorithm>
#include <sstream>
#include <string>
#include <string_view>

namespace tarn {

namespace {

constexpr std::string_view localTypes[] = {
    "ext2",   "ext3",     "ext4",  "btrfs", "xfs",   "f2fs",  "bcachefs", "zfs",     "jfs",
    "nilfs2", "reiserfs", "ubifs", "jffs2", "tmpfs", "ramfs", "rootfs",   "overlay", "squashfs",
    "erofs",  "vfat",     "exfat", "ntfs3", "msdos", "hfs",   "hfsplus",  "iso9660", "udf",
};

bool isLocal(std::string_view type) {
    return std::find(std::begin(localTypes), std::end(localTypes), type) != std::end(localTypes);
}

} // namespace

MountTable::MountTable() : table_(::open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)) {}

bool MountTable::changed() const {
    pollfd table{.fd = table_.get(), .events = POLLPRI, .revents = 0};
    return ::poll(&table, 1, 0) != 0;
}

void MountTable::read() {
    std::string text;
    char part[4096];
    ::lseek(table_.get(), 0, SEEK_SET);
    for (ssize_t count = 0; (count = ::read(table_.get(), part, sizeof part)) > 0;)
        text.append(part, static_cast<std::size_t>(count));
    local_.clear();
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        const std::size_t separator = line.find(" - "); // optional fields stand before it
        if (separator == line.npos)
            continue;
        const std::string_view rest = std::string_view(line).substr(separator + 3);
        if (isLocal(rest.substr(0, rest.find(' '))))
            local_.insert(std::strtoull(line.c_str(), nullptr, 10));
    }
    known_ = true;
}

bool MountTable::holdsLocally(int file) {
    struct statx status {};
    if (::statx(file, "", AT_EMPTY_PATH | AT_STATX_DONT_SYNC, STATX_MNT_ID, &status) != 0 ||
        (status.stx_mask & STATX_MNT_ID) == 0)
        return false;
    if (!known_ || changed())
        read();
    return local_.contains(status.stx_mnt_id);
}

} // namespace tarn
