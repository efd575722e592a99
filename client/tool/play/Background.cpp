#include "client/tool/play/Background.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <iostream>
#include <system_error>
#include <utility>

#include "client/tool/remote/BackgroundRecord.h"

namespace tarn::tool {

namespace {

/// Nobody reads on from here, and no terminal or pipe is kept open.
void leaveStandardStreams() {
    const FileDescriptor nothing(::open("/dev/null", O_RDWR | O_CLOEXEC));
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
        ::dup2(nothing.get(), stream);
}

/// The part of the new process. It tells its parent, by a byte, that it sounds.
class Owner {
public:
    Owner(PlaySession::Options options, FileDescriptor parent)
        : options_(std::move(options)), parent_(std::move(parent)), record_(options_.socketPath) {
        options_.keys = Terminal::KeySource::none;
        options_.changed = [this](const Playback& playback) { note(playback); };
        options_.failed = [this](const std::string& problem) { record_.addProblem(problem); };
    }

    int run() {
        record_.claim();
        return PlaySession(options_).run();
    }

private:
    void note(const Playback& playback) {
        const auto* track = playback.current();
        if (track == nullptr)
            return;
        record_.setTrack(track->number, playback.size());
        if (!parent_ || !playback.isPlaying())
            return;
        std::cout << "In the background: \"tarnctl status\" shows it, \"tarnctl stop\" ends it." << std::endl;
        ::setsid(); // until here ^C on the terminal ends both
        leaveStandardStreams();
        (void)!::write(parent_.get(), "", 1);
        parent_.reset();
    }

    PlaySession::Options options_;
    FileDescriptor parent_;
    BackgroundRecord record_;
};

/// Until the process sounds or has ended. Its exit status, or 0 when it sounds.
int waitUntilItSounds(pid_t process, const FileDescriptor& child) {
    char byte = 0;
    ssize_t count = 0;
    while ((count = ::read(child.get(), &byte, 1)) < 0 && errno == EINTR) {
    }
    int status = 0;
    if (count == 1)
        return 0;
    while (::waitpid(process, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

} // namespace

int playInBackground(PlaySession::Options options) {
    int ends[2] = {-1, -1};
    if (::pipe2(ends, O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "pipe");
    FileDescriptor ours(ends[0]);
    FileDescriptor its(ends[1]);
    const auto process = ::fork(); // before there is any thread or connection
    if (process < 0)
        throw std::system_error(errno, std::generic_category(), "fork");
    if (process > 0) {
        its.reset();
        return waitUntilItSounds(process, ours);
    }
    ours.reset();
    return Owner(std::move(options), std::move(its)).run();
}

} // namespace tarn::tool
