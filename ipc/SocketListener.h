#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string_view>
#include <thread>

#include "ipc/Receiver.h"
#include "ipc/SocketConnection.h"
#include "ipc/SocketPoller.h"
#include "ipc/TokenTable.h"
#include "roles/ServiceListener.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// Accepts clients on a listening socket and serves all of them on one thread, the I/O thread.
///
/// Made, resumed and destroyed by the same thread; destruction waits for what the I/O thread is doing and
/// closes all connections without running their handlers.
class SocketListener final : public ServiceListener {
public:
    static constexpr std::size_t mostConnections = 64;

    /// Parts of frames that all clients together may leave unfinished; who goes beyond is cut off.
    static constexpr std::size_t mostUnfinishedBytes = std::size_t{16} * 1'048'576;

    /// The token table and the receiver outlive the listener. Throws std::system_error.
    SocketListener(FileDescriptor listeningSocket, TokenTable& tokens, FileReceiver& files);
    ~SocketListener() override;

    void setDelegate(ServiceListenerDelegate* delegate) override { delegate_ = delegate; }

    /// Tells the service manager, if there is one, that the service is ready.
    void resume() override;

private:
    static constexpr std::uint64_t listenerKey = 1;
    static constexpr std::uint64_t firstConnectionKey = 2;

    using Connections = std::map<std::uint64_t, std::shared_ptr<SocketConnection>>;

    void run(const std::stop_token& stop);
    void serve(std::uint64_t key, std::uint32_t events);
    bool isOverLimit(SocketConnection& connection);
    void accept();
    FileDescriptor takeFromBacklog();
    void serveHangUps();
    bool mayBeOffered(int socket);
    void letGo(int socket);
    void refuse(std::string_view reason);
    void offer(FileDescriptor descriptor);
    void displaceOthers(const SocketConnection* current, FrameKind news);

    const ConnectionSocket::Sum unfinishedBytes_ = std::make_shared<std::atomic<std::size_t>>(0);
    FileDescriptor listeningSocket_;
    FileDescriptor spare_; // given up for a moment when there are no descriptors left, to refuse a client
    TokenTable& tokens_;
    FileReceiver& files_;
    ServiceListenerDelegate* delegate_ = nullptr;
    SocketPoller poller_;
    Receiver receiver_;
    Connections connections_;
    std::uint64_t nextKey_ = firstConnectionKey;
    bool toldOfRefusal_ = false; // once until a client is accepted again, so that a flood cannot fill the log
    std::jthread thread_;
};

} // namespace tarn
