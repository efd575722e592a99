#include "media/MediaParent.h"

#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>

#include "log/SystemLog.h"
#include "system/ModuleFile.h"

namespace tarn {

namespace {

constexpr char program[] = "tarn-media";
constexpr int controlSocket = 3; // where the program looks for it

/// Runs the program with `control`, without the signals that are blocked here. The error number, or 0.
int spawn(const std::string& path, int control, pid_t& process) {
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, control, controlSocket);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    sigset_t none;
    sigset_t ignored;
    sigemptyset(&none);
    sigemptyset(&ignored);
    sigaddset(&ignored, SIGPIPE);
    posix_spawnattr_setsigmask(&attributes, &none);
    posix_spawnattr_setsigdefault(&attributes, &ignored);
    // In a group of its own: what a terminal sends to the service is not for it.
    posix_spawnattr_setflags(&attributes,
                             POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETPGROUP);
    char name[sizeof program];
    std::memcpy(name, program, sizeof name);
    char* arguments[] = {name, nullptr};
    const int error = posix_spawn(&process, path.c_str(), &actions, &attributes, arguments, environ);
    posix_spawnattr_destroy(&attributes);
    posix_spawn_file_actions_destroy(&actions);
    return error;
}

} // namespace

std::optional<std::string> mediaProgram() { return findBesideModules(program); }

std::shared_ptr<MediaParent> MediaParent::start() {
    const auto path = mediaProgram();
    auto ends = Channel::makePair();
    pid_t process = -1;
    int error = path ? EMFILE : ENOENT;
    if (path && ends)
        error = spawn(*path, ends->second.socket(), process);
    if (error != 0) {
        SystemLog::error("MediaParent::start", __LINE__,
                         "%{public}s:%d: Could not start %{public}s: %{public}s", program,
                         std::strerror(error));
        return nullptr;
    }
    return std::make_shared<MediaParent>(process, std::move(ends->first));
}

MediaParent::~MediaParent() {
    ::kill(process_, SIGKILL); // even if something has stopped it
    while (::waitpid(process_, nullptr, 0) < 0 && errno == EINTR) {
    }
}

bool MediaParent::fork(ChildKind kind, std::uint64_t id, std::span<const int> files) const {
    return control_.send(ForkRequest{.child = kind, .id = id}, files) == Channel::Result::done;
}

void MediaParent::kill(std::uint64_t id) const { static_cast<void>(control_.send(KillRequest{.id = id})); }

bool MediaParent::isGood() const {
    ReceivedMessage message;
    const Channel::Result result = control_.receiveNow(message);
    if (const auto crash = message.as<ChildCrashed>(); crash && result == Channel::Result::done)
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: A process that decodes media ended by signal %d",
                         crash->signal);
    return result == Channel::Result::notNow;
}

bool MediaParent::isGone(std::chrono::milliseconds within) const {
    pollfd end{.fd = control_.socket(), .events = 0, .revents = 0};
    return ::poll(&end, 1, static_cast<int>(within.count())) == 1;
}

} // namespace tarn
