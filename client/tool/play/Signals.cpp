#include "client/tool/play/Signals.h"

#include <sys/signalfd.h>
#include <unistd.h>

#include <csignal>

namespace tarn::tool {

namespace {

sigset_t setOf(std::initializer_list<int> signals) {
    sigset_t set;
    sigemptyset(&set);
    for (const int signal : signals)
        sigaddset(&set, signal);
    return set;
}

} // namespace

Signals::Signals() {
    const auto set = setOf({SIGINT, SIGTERM, SIGHUP, SIGTSTP, SIGCONT, SIGWINCH});
    ::pthread_sigmask(SIG_BLOCK, &set, nullptr);
    std::signal(SIGTTIN, SIG_IGN);
    std::signal(SIGTTOU, SIG_IGN);
    signals_.reset(::signalfd(-1, &set, SFD_CLOEXEC | SFD_NONBLOCK));
}

std::optional<int> Signals::take() const {
    signalfd_siginfo signal{};
    if (::read(signals_.get(), &signal, sizeof(signal)) != static_cast<ssize_t>(sizeof(signal)))
        return std::nullopt;
    return static_cast<int>(signal.ssi_signo);
}

void Signals::stopHere() const {
    const auto stop = setOf({SIGTSTP});
    std::raise(SIGTSTP); // waits, until it is let through
    ::pthread_sigmask(SIG_UNBLOCK, &stop, nullptr);
    ::pthread_sigmask(SIG_BLOCK, &stop, nullptr);
}

} // namespace tarn::tool
