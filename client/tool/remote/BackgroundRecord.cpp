#include "client/tool/remote/BackgroundRecord.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <fstream>
#include <sstream>

#include "client/tool/display/Problem.h"

namespace tarn::tool {

namespace {

constexpr std::size_t mostProblems = 20;
constexpr unsigned secondsToEnd = 5;

struct flock wholeFile(short type) {
    struct flock lock {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    return lock;
}

/// Waits until the lock is had. False when that takes too long.
bool waitForLock(int file) {
    struct sigaction quiet {};
    quiet.sa_handler = [](int) {}; // it only ends the waiting
    struct sigaction before {};
    ::sigaction(SIGALRM, &quiet, &before);
    ::alarm(secondsToEnd);
    auto lock = wholeFile(F_WRLCK);
    const bool had = ::fcntl(file, F_SETLKW, &lock) == 0;
    ::alarm(0);
    ::sigaction(SIGALRM, &before, nullptr);
    return had;
}

} // namespace

BackgroundRecord::BackgroundRecord(const std::string& socketPath) : path_(socketPath + ".background") {}

std::optional<pid_t> BackgroundRecord::holder(const FileDescriptor& file) const {
    auto lock = wholeFile(F_WRLCK);
    if (!file || ::fcntl(file.get(), F_GETLK, &lock) != 0 || lock.l_type == F_UNLCK)
        return std::nullopt;
    return lock.l_pid;
}

std::optional<BackgroundRecord::Content> BackgroundRecord::read() const {
    const auto process = holder(FileDescriptor(::open(path_.c_str(), O_RDONLY | O_CLOEXEC)));
    if (!process)
        return std::nullopt;
    Content content{.process = *process, .problems = {}};
    std::ifstream file(path_);
    std::string line;
    std::getline(file, line);
    std::istringstream(line) >> content.track >> content.tracks;
    while (std::getline(file, line))
        content.problems.push_back(line);
    return content;
}

bool BackgroundRecord::endProcess() const {
    const FileDescriptor file(::open(path_.c_str(), O_RDWR | O_CLOEXEC));
    const auto process = holder(file);
    if (!process)
        return false;
    ::kill(*process, SIGTERM);
    if (!waitForLock(file.get()))
        throw Problem("process " + std::to_string(*process) + ", which plays in the background, does not end",
                      "End it by force: kill -KILL " + std::to_string(*process));
    return true;
}

void BackgroundRecord::claim() {
    endProcess();
    claimed_.reset(::open(path_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!claimed_ || !waitForLock(claimed_.get()))
        throw Problem("cannot play in the background: " + path_ + ": " +
                          std::strerror(errno), // NOLINT(concurrency-mt-unsafe): there is one thread
                      "Without --detach it needs no such file.");
    write();
}

void BackgroundRecord::setTrack(std::size_t track, std::size_t tracks) {
    if (content_.track == track && content_.tracks == tracks)
        return;
    content_.track = track;
    content_.tracks = tracks;
    write();
}

void BackgroundRecord::addProblem(const std::string& problem) {
    auto& problems = content_.problems;
    problems.push_back(problem);
    if (problems.size() > mostProblems)
        problems.erase(problems.begin());
    write();
}

void BackgroundRecord::write() const {
    if (!claimed_)
        return;
    std::string text = std::to_string(content_.track) + " " + std::to_string(content_.tracks) + "\n";
    for (const auto& problem : content_.problems)
        text += problem + "\n";
    // Should that fail, others are told less; what plays goes on.
    if (::pwrite(claimed_.get(), text.data(), text.size(), 0) == static_cast<ssize_t>(text.size()))
        (void)!::ftruncate(claimed_.get(), static_cast<off_t>(text.size()));
}

} // namespace tarn::tool
