#include "bench/controls/RunningService.h"

#include <array>
#include <stdexcept>
#include <string_view>

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>

#include "system/FileDescriptor.h"

namespace tarn {

namespace {

/// Where a service tells its manager that it is ready.
class ReadySocket {
public:
    explicit ReadySocket(const std::string& path) : socket_(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(std::begin(address.sun_path), sizeof address.sun_path - 1);
        if (::bind(socket_.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
            throw std::runtime_error("no socket for the service's notifications");
    }

    void waitForReady() const {
        std::array<char, 256> message{};
        pollfd readable{.fd = socket_.get(), .events = POLLIN, .revents = 0};
        while (poll(&readable, 1, 10'000) == 1) {
            const ssize_t length = ::recv(socket_.get(), message.data(), message.size(), 0);
            if (length > 0 &&
                std::string_view(message.data(), static_cast<std::size_t>(length)).find("READY=1") !=
                    std::string_view::npos)
                return;
        }
        throw std::runtime_error("the service does not start");
    }

private:
    FileDescriptor socket_;
};

} // namespace

RunningService::RunningService(std::vector<std::string> environment, const std::string& program) {
    const std::string folder = folder_.path();
    const std::string readyPath = folder + "/ready";
    const ReadySocket ready(readyPath);
    folder_.write("data/applications/org.example.MusicBox.desktop",
                  "[Desktop Entry]\nType=Application\nName=Music Box\nExec=true\n");
    // Of two settings of one name the first one counts: the runtime folder is not the sound server's.
    environment.insert(environment.begin(),
                       {"XDG_RUNTIME_DIR=" + folder, "HOME=" + folder, "XDG_DATA_HOME=" + folder + "/data",
                        "XDG_DATA_DIRS=" + folder + "/none", "NOTIFY_SOCKET=" + readyPath, "LANG=C"});
    environment.emplace_back("DBUS_SYSTEM_BUS_ADDRESS=unix:path=/nonexistent");
    process_ = std::make_unique<ChildProcess>(std::vector<std::string>{program}, environment,
                                              ChildProcess::ErrorOutput::withOutput);
    ready.waitForReady();
}

} // namespace tarn
