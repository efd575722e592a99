#include "mediaprocess/FileReader.h"

#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace tarn {

namespace {

// The library's fstat() takes a system call that could look at any path, and that is locked away.
int statusOf(int file, struct stat& status) {
#ifdef SYS_fstat64
    return static_cast<int>(syscall(SYS_fstat64, file, &status));
#else
    return static_cast<int>(syscall(SYS_fstat, file, &status));
#endif
}

} // namespace

FileReader::FileReader(ParkedFile file) : file_(std::move(file)) {
    struct stat status {};
    if (file_.file && statusOf(file_.file.get(), status) == 0)
        size_ = status.st_size;
}

std::int64_t FileReader::read(std::int64_t offset, std::byte* into, std::size_t size) {
    if (!file_.file)
        return -file_.error;
    ssize_t count = 0;
    do
        count = pread(file_.file.get(), into, size, offset);
    while (count < 0 && errno == EINTR);
    return count < 0 ? -errno : count;
}

} // namespace tarn
