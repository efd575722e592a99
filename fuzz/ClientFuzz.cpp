// A service that sends its client anything at all: the client tells what it understands and ends what it
// cannot read, and every command ends once.

#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>

#include <tarn/Client.h>

#include "ipc/SocketAddress.h"
#include "system/FileDescriptor.h"

namespace {

using namespace tarn;

struct Service {
    Service() {
        std::filesystem::remove(path);
        if (!SocketAddress(path).bind(listening.get()) || ::listen(listening.get(), 1) != 0)
            std::abort();
    }
    ~Service() { std::filesystem::remove(path); }

    const std::string path =
        std::filesystem::temp_directory_path() / ("client-fuzz-" + std::to_string(::getpid()));
    const FileDescriptor listening{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const Service service;
    int ended = 0;
    std::optional<client::Client> held(
        std::in_place,
        client::Client::Options{.socketPath = service.path, .driver = client::Driver::program});
    client::Client& client = *held;
    const FileDescriptor connection(::accept4(service.listening.get(), nullptr, nullptr, SOCK_CLOEXEC));
    client.upsertAsset({.identifier = "a", .URL = "file:///a"}, [&](const auto&) { ++ended; });
    client.upsertItem("a", "a", [&](const auto&) { ++ended; });
    client.currentTime("a", [&](const auto&) { ++ended; });
    static_cast<void>(::send(connection.get(), data, size, MSG_DONTWAIT | MSG_NOSIGNAL));
    ::shutdown(connection.get(), SHUT_RDWR);
    for (bool isOver = false; !isOver;) {
        const auto event = client.nextEvent(std::chrono::seconds(10));
        isOver = !event || std::holds_alternative<client::ConnectionLost>(*event) ||
                 std::holds_alternative<client::TakenOver>(*event);
    }
    held.reset(); // ends what is left
    if (ended != 3)
        std::abort();
    return 0;
}
