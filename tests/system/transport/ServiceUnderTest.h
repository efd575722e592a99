#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <tarn/Client.h>

#include "tests/ipc/RawClient.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A real tarnd on a socket of its own, and what tests do with it. It has a sound server, a bus and data
/// folders only where `environment` says so.
class ServiceUnderTest {
public:
    explicit ServiceUnderTest(std::vector<std::string> environment = {})
        : environment_(std::move(environment)) {
        start();
    }

    /// Starts it, after stop() or kill() again, and waits until it is ready.
    void start();

    /// While it does not run: from now on the socket is held here, and handed to it when it starts.
    void holdSocket();

    /// Asks for its end; its exit status.
    int stop(int signal = SIGTERM);
    void kill();

    std::string socketPath() const { return (folder_ / "ostrel.tarnd").string(); }
    ChildProcess& process() { return *process_; }
    const TemporaryFolder& folder() const { return folder_; }

    client::Client::Options options() const { return {.socketPath = socketPath()}; }
    RawClient connectRaw() const { return RawClient(socketPath()); }

    /// Waits for an error line; false when the deadline passes without one.
    bool logs(const char* text) { return process_->readUntil(text); }

    std::size_t openFiles() const;
    std::size_t threads() const;

    /// Makes a file of silence; its URL.
    std::string song(const std::string& name = "song.wav", std::uint32_t seconds = 1) const;

private:
    std::size_t entriesOf(const char* folder) const;

    const std::vector<std::string> environment_;
    TemporaryFolder folder_;
    FileDescriptor heldSocket_;
    std::unique_ptr<ChildProcess> process_;
};

/// Whether the service carries out commands of this client: makes an item of the song and asks for its
/// position.
bool isServed(client::Client& client, const std::string& songURL);

} // namespace tarn
