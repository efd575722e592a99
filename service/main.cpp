#include <unistd.h>

#include <cstdlib>
#include <exception>
#include <iostream>
#include <memory>
#include <string_view>

#include "log/SystemSink.h"
#include "media/MediaParent.h"
#include "service/LinuxPlatform.h"
#include "service/LongFormAudioServer.h"
#include "system/Process.h"

namespace {

constexpr std::string_view usage = R"(Usage: tarnd [--version | --help]

Plays audio files in the background for the programs that connect to it. It listens on the socket
"ostrel.tarnd" in $XDG_RUNTIME_DIR, or in /run without it, unless the service manager hands it over.
There is nothing to configure. To play something: tarnctl play FILE
)";

/// Also what holds those who read media: the program that does can tell.
int tellVersion() {
    std::cout << "tarnd " TARN_VERSION << std::endl;
    if (const auto path = tarn::mediaProgram())
        ::execl(path->c_str(), path->c_str(), "--lock-down", nullptr);
    std::cout << "The program that decodes media is not installed.\n";
    return EXIT_FAILURE;
}

int runService() {
    tarn::prepareSignals();
    tarn::raiseFileLimit();
    tarn::returnFreedMemory();
    tarn::SystemLog::setSink(tarn::systemSink("tarnd"));
    // Threads use both until the process ends; neither is ever destroyed.
    static auto& platform = *new tarn::LinuxPlatform;
    tarn::endOnStopSignals([] { platform.listeners.removeSocketFiles(); });
    tarn::VLLongFormAudioServer::sharedLongFormAudioServer(platform.roles())->run();
    return EXIT_FAILURE;
}

} // namespace

int main(int argc, char** argv) {
    const std::string_view option = argc > 1 ? argv[1] : "";
    if (argc == 2 && option == "--version") {
        return tellVersion();
    }
    if (argc > 1) {
        const bool wantsHelp = argc == 2 && option == "--help";
        (wantsHelp ? std::cout : std::cerr) << usage;
        return wantsHelp ? EXIT_SUCCESS : 2;
    }
    try {
        return runService();
    } catch (const std::exception& failure) {
        std::cerr << "tarnd: " << failure.what() << "\n";
        return EXIT_FAILURE;
    }
}
