#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <iostream>
#include <string_view>

#include "decoder/FfmpegLimits.h"
#include "mediaprocess/LockDown.h"
#include "mediaprocess/Parent.h"

namespace {

constexpr int serviceSocket = 3;
constexpr int killedFirst = 500; // of 1000: before the service, when memory runs out

constexpr std::string_view usage = R"(Usage: tarn-media [--lock-down]

Opens and decodes files for tarnd, which starts it. With --lock-down it tells what would hold the process that
decodes a file on this machine.
)";

bool isSocket(int number) {
    int type = 0;
    socklen_t size = sizeof type;
    return ::getsockopt(number, SOL_SOCKET, SO_TYPE, &type, &size) == 0 && type == SOCK_SEQPACKET;
}

/// Tried by a child, as it could not be undone.
std::uint32_t locksOfAChild() {
    const pid_t child = ::fork();
    if (child == 0)
        _exit(static_cast<int>(tarn::lockDown(tarn::privateMemory())));
    int status = 0;
    return ::waitpid(child, &status, 0) == child && WIFEXITED(status)
               ? static_cast<std::uint32_t>(WEXITSTATUS(status))
               : 0;
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 2 && argv[1] == std::string_view("--lock-down")) {
        std::cout << "What decodes media is locked down: " << tarn::lockDownText(locksOfAChild()) << "\n";
        return EXIT_SUCCESS;
    }
    if (argc > 1 || !isSocket(serviceSocket)) {
        std::cerr << usage;
        return 2;
    }
    std::ofstream("/proc/self/oom_score_adj") << killedFirst;
    tarn::setFfmpegLimits();
    tarn::Parent(tarn::Channel(tarn::FileDescriptor(serviceSocket))).run();
    _exit(EXIT_SUCCESS); // nothing is left to be told to anyone
}
