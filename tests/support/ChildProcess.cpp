#include "tests/support/ChildProcess.h"

#include <algorithm>
#include <array>
#include <system_error>

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tarn {

namespace {

std::vector<std::string> environmentWith(const std::vector<std::string>& additions) {
    std::vector<std::string> result = additions;
    for (char** entry = environ; *entry; ++entry) {
        const std::string_view own = *entry;
        const std::string_view name = own.substr(0, own.find('=') + 1);
        const bool replaced = std::any_of(additions.begin(), additions.end(),
                                          [&](const std::string& added) { return added.starts_with(name); });
        if (!replaced)
            result.emplace_back(own);
    }
    return result;
}

std::vector<char*> pointersTo(std::vector<std::string>& texts) {
    std::vector<char*> result;
    result.reserve(texts.size() + 1);
    for (std::string& text : texts)
        result.push_back(text.data());
    result.push_back(nullptr);
    return result;
}

} // namespace

ChildProcess::ChildProcess(const std::vector<std::string>& command,
                           const std::vector<std::string>& environment, ErrorOutput errorOutput) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "pipe2");
    output_.reset(ends[0]);
    const FileDescriptor childOutput(ends[1]);

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, childOutput.get(), STDOUT_FILENO);
    if (errorOutput == ErrorOutput::withOutput)
        posix_spawn_file_actions_adddup2(&actions, childOutput.get(), STDERR_FILENO);
    std::vector<std::string> arguments = command;
    std::vector<std::string> variables = environmentWith(environment);
    const int result = posix_spawnp(&pid_, command.front().c_str(), &actions, nullptr,
                                    pointersTo(arguments).data(), pointersTo(variables).data());
    posix_spawn_file_actions_destroy(&actions);
    if (result != 0)
        throw std::system_error(result, std::generic_category(), command.front());
}

ChildProcess::~ChildProcess() {
    if (!status_) {
        signal(SIGKILL);
        wait();
    }
    if (discarding_.joinable())
        discarding_.join();
}

void ChildProcess::signal(int number) const {
    if (!status_)
        ::kill(pid_, number);
}

std::optional<std::string> ChildProcess::readLine(std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    std::size_t end = 0;
    while ((end = unread_.find('\n')) == std::string::npos)
        if (!readMore(deadline))
            return std::nullopt;
    std::string line = unread_.substr(0, end);
    unread_.erase(0, end + 1);
    return line;
}

bool ChildProcess::readUntil(std::string_view text, std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (const auto line = readLine(std::chrono::duration_cast<std::chrono::milliseconds>(
               std::max(deadline - std::chrono::steady_clock::now(), std::chrono::nanoseconds::zero()))))
        if (line->find(text) != std::string::npos)
            return true;
    return false;
}

void ChildProcess::discardOutput() {
    discarding_ = std::thread([this] {
        std::array<char, 4096> bytes{};
        while (::read(output_.get(), bytes.data(), bytes.size()) > 0) {
        }
    });
}

std::string ChildProcess::readAll(std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (readMore(deadline)) {
    }
    return std::exchange(unread_, {});
}

bool ChildProcess::readMore(std::chrono::steady_clock::time_point deadline) {
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    pollfd readable{.fd = output_.get(), .events = POLLIN, .revents = 0};
    if (poll(&readable, 1, static_cast<int>(std::max<std::int64_t>(left.count(), 0))) <= 0)
        return false;
    std::array<char, 4096> bytes{};
    const ssize_t count = ::read(output_.get(), bytes.data(), bytes.size());
    if (count <= 0)
        return false;
    unread_.append(bytes.data(), static_cast<std::size_t>(count));
    return true;
}

int ChildProcess::wait() {
    if (!status_) {
        int status = 0;
        while (waitpid(pid_, &status, 0) < 0 && errno == EINTR) {
        }
        status_ = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
    }
    return *status_;
}

CommandResult runCommand(const std::vector<std::string>& command,
                         const std::vector<std::string>& environment) {
    ChildProcess process(command, environment, ChildProcess::ErrorOutput::withOutput);
    std::string output = process.readAll();
    return {process.wait(), std::move(output)};
}

} // namespace tarn
