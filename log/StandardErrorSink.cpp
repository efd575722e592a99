#include "log/StandardErrorSink.h"

#include <cerrno>
#include <fcntl.h>
#include <poll.h>
#include <string>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include "log/LogFormat.h"
#include "log/LogLine.h"

namespace tarn {

namespace {

static_assert(logMessageLimit + 8 < 4096, "a line fits a pipe's page: it is written whole or not at all");

bool hasRoomForALine(int descriptor) {
    pollfd entry{descriptor, POLLOUT, 0};
    return poll(&entry, 1, 0) == 1 && (entry.revents & POLLOUT) != 0;
}

FileDescriptor openedAnew(int descriptor) {
    struct stat status {};
    if (fstat(descriptor, &status) != 0 || (!S_ISFIFO(status.st_mode) && isatty(descriptor) != 1))
        return {};
    const std::string path = "/proc/self/fd/" + std::to_string(descriptor);
    return FileDescriptor(open(path.c_str(), O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
}

} // namespace

StandardErrorSink::StandardErrorSink(int descriptor)
    : descriptor_(descriptor), isTerminal_(isatty(descriptor) == 1), own_(openedAnew(descriptor)) {}

bool StandardErrorSink::take(const LogRecord& record) {
    if (!unfinished_.empty()) {
        const ssize_t written = writeNow(unfinished_);
        unfinished_.erase(0, written > 0 ? static_cast<std::size_t>(written) : 0);
        if (!unfinished_.empty())
            return false;
    }
    const std::string line = isTerminal_ ? std::string(record.message) + '\n' : standardErrorLine(record);
    const ssize_t written = writeNow(line);
    if (written > 0)
        unfinished_ = line.substr(static_cast<std::size_t>(written));
    return written > 0;
}

ssize_t StandardErrorSink::writeNow(const std::string& text) const {
    if (own_)
        return ::write(own_.get(), text.data(), text.size());
    const ssize_t sent = ::send(descriptor_, text.data(), text.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
    if (sent >= 0 || errno != ENOTSOCK)
        return sent;
    return hasRoomForALine(descriptor_) ? ::write(descriptor_, text.data(), text.size()) : -1;
}

} // namespace tarn
