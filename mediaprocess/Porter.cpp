#include "mediaprocess/Porter.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <cerrno>
#include <vector>

#include "mediaprotocol/Parking.h"

namespace tarn {

namespace {

constexpr std::size_t mostReceivedFiles = 253; // what the system lets through at once

// Asks no file system: what is known of an open file will do.
bool isRegular(int file) {
    struct statx status {};
    return ::statx(file, "", AT_EMPTY_PATH | AT_STATX_DONT_SYNC, STATX_TYPE, &status) == 0 &&
           S_ISREG(status.stx_mode);
}

bool isReadable(int file) {
    const int flags = ::fcntl(file, F_GETFL);
    return flags >= 0 && (flags & O_PATH) == 0 && (flags & O_ACCMODE) != O_WRONLY;
}

/// Opens what `named` names, for reading. The flags are for the case that it is not what it was.
ParkedFile openNamed(int named) {
    const std::string path = "/proc/self/fd/" + std::to_string(named);
    ParkedFile opened{FileDescriptor(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY))};
    opened.error = opened.file ? 0 : errno;
    return opened;
}

/// Reads up to `bytes` bytes and the files among them, which it appends to `files`. False when nothing is
/// there.
bool receiveFiles(int connection, std::size_t bytes, std::vector<FileDescriptor>& files) {
    std::vector<char> ignored(bytes);
    iovec part{ignored.data(), ignored.size()};
    alignas(cmsghdr) std::byte control[CMSG_SPACE(mostReceivedFiles * sizeof(int))];
    msghdr message{};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof control;
    if (::recvmsg(connection, &message, MSG_DONTWAIT | MSG_CMSG_CLOEXEC) <= 0)
        return false;
    for (cmsghdr* header = CMSG_FIRSTHDR(&message); header != nullptr;
         header = CMSG_NXTHDR(&message, header)) {
        if (header->cmsg_level != SOL_SOCKET || header->cmsg_type != SCM_RIGHTS)
            continue;
        for (std::size_t at = 0; at < header->cmsg_len - CMSG_LEN(0); at += sizeof(int)) {
            int number = -1;
            std::memcpy(&number, CMSG_DATA(header) + at, sizeof number);
            files.emplace_back(number);
        }
    }
    return true;
}

/// Takes all files out of a socket that the service lets go, at about the same time: who closes it last would
/// else close them too.
void dropFiles(FileDescriptor connection) {
    constexpr std::size_t piece = 65'536;
    std::vector<FileDescriptor> files;
    while (receiveFiles(connection.get(), piece, files)) {
    }
    connection.reset(); // closing the files may take for ever
}

} // namespace

void Porter::run() {
    ReceivedMessage message;
    while (service_.receive(message, ReceivedMessage::mostFiles) == Channel::Result::done)
        if (!serve(message) && service_.send(ChildIsIdle{}) != Channel::Result::done)
            return;
}

/// True when an answer has told that nothing is left to be done. What is not handed on is closed behind the
/// answer.
bool Porter::serve(ReceivedMessage& message) {
    FileDescriptor first = message.takeFile(0);
    const FileDescriptor second = message.takeFile(1);
    std::vector<FileDescriptor> files(1); // the first one is handed on
    Ported answer;
    if (const auto path = message.as<OpenPath>(); path && path->length <= OpenPath::longest) {
        answer = openPath(std::string(path->path.data(), path->length), files[0]);
    } else if (const auto received = message.as<ReceiveFile>()) {
        answer = receiveFile(std::move(first), received->bytes, files);
    } else {
        if (message.as<DropFile>())
            dropFiles(std::move(first));
        else if (message.as<ReopenFile>()) {
            const ParkedFile opened = openNamed(first.get());
            static_cast<void>(sendParked(second.get(), opened.file.get(), opened.error));
        }
        return false;
    }
    std::vector<int> handed;
    if (answer.form != FileForm::none)
        handed.push_back(files[0].get());
    return service_.send(answer, handed) == Channel::Result::done && answer.idle == 1;
}

Ported Porter::openPath(const std::string& path, FileDescriptor& file) {
    // Only named at first: opening a device can do things, and to let a name go never hangs.
    file.reset(::open(path.c_str(), O_PATH | O_CLOEXEC));
    if (!file)
        return {.refusal = Ported::Refusal::cannotOpen, .error = errno, .idle = 1};
    if (!isRegular(file.get()))
        return {.refusal = Ported::Refusal::notRegular, .idle = 1};
    if (!mounts_.holdsLocally(file.get()))
        return {.form = FileForm::path, .idle = 1};
    ParkedFile opened = openNamed(file.get());
    if (!opened.file)
        return {.refusal = Ported::Refusal::cannotOpen, .error = opened.error, .idle = 1};
    file = std::move(opened.file);
    return {.form = FileForm::open, .idle = 1};
}

Ported Porter::receiveFile(FileDescriptor connection, std::size_t bytes, std::vector<FileDescriptor>& files) {
    files.clear();
    const bool taken = receiveFiles(connection.get(), bytes, files);
    connection.reset(); // at once: while it is open here the client does not see the service's end
    if (taken && files.empty())
        return {.refusal = Ported::Refusal::noFile, .idle = 1};
    if (files.size() != 1)
        return {.refusal = Ported::Refusal::notOneFile};
    if (!isRegular(files[0].get()))
        return {.refusal = Ported::Refusal::notRegular};
    if (!isReadable(files[0].get()))
        return {.refusal = Ported::Refusal::notReadable};
    if (mounts_.holdsLocally(files[0].get()))
        return {.form = FileForm::open, .idle = 1};
    auto place = Channel::makePair();
    if (!place || !sendParked(place->first.socket(), files[0].get()))
        return {.refusal = Ported::Refusal::cannotOpen, .error = EMFILE};
    files.insert(files.begin(), place->second.takeSocket());
    return {.form = FileForm::parked};
}

} // namespace tarn
