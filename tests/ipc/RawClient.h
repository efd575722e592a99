#pragma once

#include <chrono>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "ipc/FrameReader.h"
#include "roles/Data.h"

namespace tarn {

inline Data bytes(std::string_view text) { return {text.begin(), text.end()}; }

/// A client that speaks in frames and can get everything wrong.
class RawClient {
public:
    /// Fails the test when nobody listens.
    explicit RawClient(const std::string& path);

    /// Waits until the socket took it all; false when the service has ended the connection.
    bool sendBytes(std::span<const std::uint8_t> bytes) const;
    bool send(FrameKind kind, std::uint64_t callId = 0, std::string_view body = {}) const;
    /// The descriptors stay the caller's.
    bool sendWithFiles(std::span<const std::uint8_t> bytes, const std::vector<int>& files) const;
    bool grant(const std::string& token, const std::string& path, int file) const;

    /// The next frame; none at the end of the stream or when the deadline passes.
    std::optional<Frame> receive();

    /// Whether the service ended the connection before the deadline; frames on the way are dropped.
    bool isCutOff();

    void hangUp() { socket_.reset(); }
    int socket() const { return socket_.get(); }

private:
    FileDescriptor socket_;
    FrameReader reader_{FrameReader::Sender::service};
    std::vector<Frame> frames_;
    bool ended_ = false;
};

} // namespace tarn
