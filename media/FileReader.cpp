#include "media/FileReader.h"

#include <unistd.h>

#include <cerrno>

namespace tarn {

bool FileReader::expired() const { return deadline_ && std::chrono::steady_clock::now() >= *deadline_; }

std::int64_t FileReader::read(std::int64_t offset, std::byte* into, std::size_t size) {
    if (expired())
        return -ETIMEDOUT;
    ssize_t count = 0;
    do {
        count = pread(file_->descriptor.get(), into, size, offset);
    } while (count < 0 && errno == EINTR);
    return count < 0 ? -errno : count;
}

} // namespace tarn
