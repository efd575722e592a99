#pragma once

#include <memory>
#include <string>
#include <vector>

#include "ipc/ListeningSocket.h"
#include "ipc/TokenTable.h"
#include "roles/ServiceListener.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Makes listeners on Unix sockets. Outlives them; owns their socket files.
class SocketListeners final : public ServiceListeners {
public:
    /// Both outlive the listeners.
    SocketListeners(TokenTable& tokens, FileReceiver& files) : tokens_(tokens), files_(files) {}

    /// Throws std::system_error, or std::runtime_error when another process serves the name.
    std::unique_ptr<ServiceListener> createWithServiceName(const std::string& name) override;

    /// For a process that is about to end. Any thread, at any time; waits for a listener that is being made.
    void removeSocketFiles() const;

private:
    TokenTable& tokens_;
    FileReceiver& files_;
    MutexProtected<std::vector<std::unique_ptr<ListeningSocket>>> sockets_;
};

} // namespace tarn
