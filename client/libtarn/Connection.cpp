#include "tarn/Connection.h"

#include <fcntl.h>

#include <cerrno>
#include <system_error>
#include <utility>

#include "client/libtarn/ConnectionImplementation.h"
#include "ipc/TransportMessages.h"

namespace tarn::client {

std::string defaultSocketPath() { return serviceSocketPath("ostrel.tarnd"); }

Connection::Connection(Handlers handlers, std::string socketPath)
    : Connection(Within(),
                 std::make_unique<Implementation>(std::make_shared<Link>(
                     Link::Handlers{std::move(handlers)}, std::move(socketPath), Driver::ownThread))) {
    implementation_->link->connect(Link::Patience::waits);
    implementation_->link->start();
}

Connection::Connection(Within, std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}

Connection::~Connection() {
    if (implementation_->isLeftBehind())
        (void)implementation_.release(); // its thread and its locks are the parent's
}

void Connection::call(const Bytes& envelope, AnswerHandler handler) {
    Link::requireThatItFits(envelope);
    // A link that does not take the call leaves the handler alone.
    if (implementation_->isLeftBehind() || !implementation_->link->call(envelope, std::move(handler)))
        handler(Answer{}); // NOLINT(bugprone-use-after-move)
    else
        implementation_->link->waitForRoom();
}

bool Connection::send(const Bytes& envelope) {
    Link::requireThatItFits(envelope);
    if (implementation_->isLeftBehind() || !implementation_->link->send(FrameKind::call, envelope))
        return false;
    implementation_->link->waitForRoom();
    return true;
}

bool Connection::grant(const std::string& token, const std::string& path, int file) {
    if (implementation_->isLeftBehind())
        return false;
    FileDescriptor kept(::fcntl(file, F_DUPFD_CLOEXEC, 0));
    if (!kept)
        throw std::system_error(errno, std::generic_category(), path);
    const auto extension = encodeExtension({token, path});
    Link::requireThatItFits(extension);
    return implementation_->link->send(FrameKind::extension, extension, std::move(kept));
}

bool Connection::isConnected() const {
    return !implementation_->isLeftBehind() && implementation_->link->isConnected();
}

void Connection::disconnect() {
    if (!implementation_->isLeftBehind())
        implementation_->link->disconnect();
}

void Connection::reconnect() {
    if (implementation_->isLeftBehind())
        throw std::system_error(ENOTCONN, std::generic_category(), "a connection of the parent process");
    implementation_->link->connect(Link::Patience::waits);
}

} // namespace tarn::client
