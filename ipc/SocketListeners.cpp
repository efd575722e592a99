#include "ipc/SocketListeners.h"

#include "ipc/SocketListener.h"

namespace tarn {

std::unique_ptr<ServiceListener> SocketListeners::createWithServiceName(const std::string& name) {
    return sockets_.withLocked([&](auto& sockets) {
        auto& socket = sockets.emplace_back(std::make_unique<ListeningSocket>(name));
        return std::make_unique<SocketListener>(socket->take(), tokens_, files_);
    });
}

void SocketListeners::removeSocketFiles() const {
    sockets_.withLocked([](const auto& sockets) {
        for (const auto& socket : sockets)
            socket->removeFile();
    });
}

} // namespace tarn
