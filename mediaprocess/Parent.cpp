#include "mediaprocess/Parent.h"

#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cassert>
#include <csignal>

#include "mediaprocess/Examiner.h"
#include "mediaprocess/LockDown.h"
#include "mediaprocess/Porter.h"
#include "mediaprocess/Renderer.h"

namespace tarn {

namespace {

constexpr std::chrono::seconds longestWait{10}; // of a child that does one thing after the other

/// Ends of children interrupt nothing but the wait below.
void holdChildSignal() {
    struct sigaction action {};
    action.sa_handler = [](int) {};
    ::sigaction(SIGCHLD, &action, nullptr);
    sigset_t set;
    sigemptyset(&set);
    sigaddset(&set, SIGCHLD);
    ::sigprocmask(SIG_BLOCK, &set, nullptr);
}

} // namespace

Parent::Parent(Channel service)
    : service_(std::move(service)), self_(::getpid()), ownMemory_(privateMemory()) {
    holdChildSignal();
}

void Parent::run() {
    sigset_t none;
    sigemptyset(&none);
    while (!isChild_) {
        pollfd readable{.fd = service_.socket(), .events = POLLIN, .revents = 0};
        ::ppoll(&readable, 1, nullptr, &none);
        reap();
        ReceivedMessage message;
        const Channel::Result result = service_.receiveNow(message, ReceivedMessage::mostFiles);
        if (result == Channel::Result::done)
            serve(message);
        else if (result != Channel::Result::notNow)
            return;
    }
}

void Parent::serve(ReceivedMessage& message) {
    if (const auto request = message.as<ForkRequest>())
        fork(*request, message.takeFile(0), message.takeFile(1));
    else if (const auto end = message.as<KillRequest>())
        kill(end->id);
}

// When there can be no more children the socket closes, which tells the service.
void Parent::fork(const ForkRequest& request, FileDescriptor socket, FileDescriptor ring) {
    const pid_t pid = ::fork();
    if (pid > 0)
        children_.emplace(pid, request.id);
    if (pid != 0)
        return;
    isChild_ = true;
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (::getppid() != self_)
        return;
    service_ = Channel();
    runChild(request.child, Channel(std::move(socket)), ring);
}

void Parent::runChild(ChildKind kind, Channel service, const FileDescriptor& ring) const {
    if (kind != ChildKind::renderer)
        service.limitWaits(longestWait); // while it may still say so
    switch (kind) {
    case ChildKind::porter:
        ::prctl(PR_SET_NAME, "tarn-porter");
        return Porter(std::move(service)).run();
    case ChildKind::examiner:
        ::prctl(PR_SET_NAME, "tarn-examiner");
        return Examiner(std::move(service), lockDown(ownMemory_)).run();
    case ChildKind::renderer:
        ::prctl(PR_SET_NAME, "tarn-renderer");
        if (auto memory = RingMemory::map(ring))
            Renderer(std::move(service), std::move(*memory), lockDown(ownMemory_)).run();
        return;
    }
}

void Parent::kill(std::uint64_t id) const {
    for (const auto& [pid, child] : children_)
        if (child == id)
            ::kill(pid, SIGKILL);
}

void Parent::reap() {
    int status = 0;
    for (pid_t pid = 0; (pid = ::waitpid(-1, &status, WNOHANG)) > 0;) {
        const auto child = children_.find(pid);
        assert(child != children_.end());
        if (WIFSIGNALED(status) && WTERMSIG(status) != SIGKILL)
            static_cast<void>(service_.send(ChildCrashed{.signal = WTERMSIG(status), .id = child->second}));
        children_.erase(child);
    }
}

} // namespace tarn
