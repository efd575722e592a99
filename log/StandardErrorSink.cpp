#include "log/StandardErrorSink.h"

#include <cerrno>
#include <poll.h>
#include <string>
#include <sys/socket.h>
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

/// The descriptor is shared with other programs, so it cannot be switched to non-blocking: a socket is asked
/// per call, anything else is asked for room first.
ssize_t writeWithoutWaiting(int descriptor, const std::string& line) {
    const ssize_t sent = send(descriptor, line.data(), line.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
    if (sent >= 0 || errno != ENOTSOCK)
        return sent;
    return hasRoomForALine(descriptor) ? write(descriptor, line.data(), line.size()) : -1;
}

} // namespace

StandardErrorSink::StandardErrorSink(int descriptor)
    : descriptor_(descriptor), isTerminal_(isatty(descriptor) == 1) {}

bool StandardErrorSink::take(const LogRecord& record) {
    const std::string line = isTerminal_ ? std::string(record.message) + '\n' : standardErrorLine(record);
    return writeWithoutWaiting(descriptor_, line) == static_cast<ssize_t>(line.size());
}

} // namespace tarn
