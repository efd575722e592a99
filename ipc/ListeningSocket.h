#pragma once

#include <string>

#include "system/FileDescriptor.h"

namespace tarn {

/// The socket on which a named service listens: handed over by systemd, or made in the folder of sockets.
///
/// A socket file that nobody listens on is replaced. The file goes with this object.
class ListeningSocket {
public:
    /// Throws std::system_error, or std::runtime_error when somebody listens already.
    explicit ListeningSocket(const std::string& name);
    ~ListeningSocket();
    ListeningSocket(const ListeningSocket&) = delete;
    ListeningSocket& operator=(const ListeningSocket&) = delete;

    /// Gives the socket away; the file stays this object's.
    FileDescriptor take() { return std::move(socket_); }

    /// Removes the socket file, if it was made here. Safe to call again, and from any thread.
    void removeFile() const;

private:
    void makeFile(const std::string& path);

    FileDescriptor socket_;
    FileDescriptor lock_; // held while the socket file is ours
    std::string path_;    // empty when the socket was handed over
};

} // namespace tarn
