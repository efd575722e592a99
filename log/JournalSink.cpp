#include "log/JournalSink.h"

#include <cerrno>
#include <string_view>
#include <sys/socket.h>
#include <sys/un.h>
#include <utility>

#include "log/LogLine.h"

namespace tarn {

namespace {

/// A value of one line stands behind its name and an equals sign; records hold no others.
void appendField(std::string& datagram, std::string_view name, std::string_view value) {
    datagram += name;
    datagram += '=';
    datagram += value;
    datagram += '\n';
}

std::string journalDatagram(const LogRecord& record, const std::string& identifier) {
    std::string datagram;
    appendField(datagram, "MESSAGE", record.message);
    appendField(datagram, "PRIORITY", std::to_string(logPriority(record.level)));
    appendField(datagram, "CODE_FUNC", record.method);
    appendField(datagram, "CODE_LINE", std::to_string(record.line));
    appendField(datagram, "SUBSYSTEM", logSubsystem);
    appendField(datagram, "CATEGORY", logCategoryName(record.category));
    appendField(datagram, "SYSLOG_IDENTIFIER", identifier);
    return datagram;
}

/// Sending to the address each time, rather than connecting once, finds the journal again after its restart.
ssize_t sendWithoutWaiting(int socket, const std::string& path, const std::string& datagram) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(static_cast<char*>(address.sun_path), sizeof address.sun_path - 1);
    return sendto(socket, datagram.data(), datagram.size(), MSG_DONTWAIT | MSG_NOSIGNAL,
                  reinterpret_cast<const sockaddr*>(&address), sizeof address);
}

} // namespace

JournalSink::JournalSink(std::string identifier, std::shared_ptr<LogSink> fallback, std::string socketPath)
    : identifier_(std::move(identifier)),
      fallback_(std::move(fallback)),
      socketPath_(std::move(socketPath)),
      socket_(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {}

bool JournalSink::take(const LogRecord& record) {
    const std::string datagram = journalDatagram(record, identifier_);
    if (sendWithoutWaiting(socket_.get(), socketPath_, datagram) >= 0)
        return true;
    if (errno == EAGAIN || errno == ENOBUFS)
        return false;
    fallback_->write(record);
    return true;
}

} // namespace tarn
