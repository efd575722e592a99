#include "bench/ipc/ServiceProcess.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string_view>

#include "bench/support/ProcFile.h"
#include "ipc/SocketAddress.h"

namespace tarn::bench {

namespace {

namespace fs = std::filesystem;

std::size_t entriesOf(const fs::path& folder) {
    return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder), fs::directory_iterator()));
}

/// Ends the program when the service does not become ready.
void waitUntilReady(int notifications) {
    constexpr timeval deadline{10, 0};
    ::setsockopt(notifications, SOL_SOCKET, SO_RCVTIMEO, &deadline, sizeof(deadline));
    std::array<char, 64> message{};
    while (::recv(notifications, message.data(), message.size() - 1, 0) > 0)
        if (std::string_view(message.data()).find("READY=1") != std::string_view::npos)
            return;
    std::fprintf(stderr, "the service did not become ready\n");
    std::abort();
}

[[noreturn]] void become(const fs::path& program, const fs::path& folder, const fs::path& readySocket) {
    ::setenv("XDG_RUNTIME_DIR", folder.c_str(), 1);
    ::setenv("NOTIFY_SOCKET", readySocket.c_str(), 1);
    ::unsetenv("DBUS_SESSION_BUS_ADDRESS");
    const int nowhere = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
    ::dup2(nowhere, STDERR_FILENO);
    ::execl(program.c_str(), "tarnd", nullptr);
    _exit(127);
}

} // namespace

ServiceProcess::ServiceProcess(const fs::path& program) {
    std::string name = (fs::temp_directory_path() / "tarn-bench-XXXXXX").string();
    if (::mkdtemp(name.data()) == nullptr)
        std::abort();
    folder_ = name;
    const auto readyPath = folder_ / "ready";
    const FileDescriptor ready(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (!SocketAddress(readyPath.string()).bind(ready.get()))
        std::abort();
    const auto begin = std::chrono::steady_clock::now();
    pid_ = ::fork();
    if (pid_ == 0)
        become(program, folder_, readyPath);
    waitUntilReady(ready.get());
    startTime_ = std::chrono::steady_clock::now() - begin;
}

ServiceProcess::~ServiceProcess() {
    ::kill(pid_, SIGTERM);
    ::waitpid(pid_, nullptr, 0);
    fs::remove_all(folder_);
}

FileDescriptor ServiceProcess::connect() const {
    FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!SocketAddress((folder_ / "ostrel.tarnd").string()).connect(socket.get())) {
        std::perror("connect");
        std::abort();
    }
    return socket;
}

long ServiceProcess::memory() const {
    return numberInProcFile(fs::path("/proc") / std::to_string(pid_) / "smaps_rollup", "Pss:");
}

long ServiceProcess::residentMemory() const {
    return numberInProcFile(fs::path("/proc") / std::to_string(pid_) / "status", "VmRSS:");
}

long ServiceProcess::anonymousMemory() const {
    return numberInProcFile(fs::path("/proc") / std::to_string(pid_) / "status", "RssAnon:");
}

std::chrono::nanoseconds ServiceProcess::processorTime() const {
    clockid_t clock = 0;
    timespec time{};
    if (::clock_getcpuclockid(pid_, &clock) != 0 || ::clock_gettime(clock, &time) != 0)
        std::abort();
    return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

std::size_t ServiceProcess::threads() const {
    return entriesOf(fs::path("/proc") / std::to_string(pid_) / "task");
}

std::size_t ServiceProcess::openFiles() const {
    return entriesOf(fs::path("/proc") / std::to_string(pid_) / "fd");
}

long ServiceProcess::wakeups() const {
    long sum = 0;
    for (const auto& task : fs::directory_iterator(fs::path("/proc") / std::to_string(pid_) / "task"))
        sum += numberInProcFile(task.path() / "status", "voluntary_ctxt_switches:");
    return sum;
}

} // namespace tarn::bench
