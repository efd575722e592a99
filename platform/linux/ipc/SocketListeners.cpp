#include "platform/linux/ipc/SocketListeners.h"

#include "platform/linux/ipc/SocketListener.h"

namespace tarn {

std::unique_ptr<ServiceListener> SocketListeners::createWithServiceName(const std::string& name) {
    auto socket = std::make_unique<ListeningSocket>(name);
    auto listener = std::make_unique<SocketListener>(socket->take(), tokens_);
    sockets_.push_back(std::move(socket));
    return listener;
}

void SocketListeners::removeSocketFiles() const {
    for (const auto& socket : sockets_)
        socket->removeFile();
}

} // namespace tarn
