#pragma once

#include <chrono>
#include <csignal>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <sys/types.h>

#include "system/FileDescriptor.h"

namespace tarn {

/// A program that a test has started, with a pipe from its standard output. It is killed at the end of the
/// scope.
class ChildProcess final {
public:
    enum class ErrorOutput { inherited, withOutput };

    /// `environment` holds "NAME=value" in addition to, or in place of, the test's own. The program is looked
    /// up in PATH. Throws when it cannot be started.
    explicit ChildProcess(const std::vector<std::string>& command,
                          const std::vector<std::string>& environment = {},
                          ErrorOutput errorOutput = ErrorOutput::inherited);
    ~ChildProcess();

    ChildProcess(const ChildProcess&) = delete;
    ChildProcess& operator=(const ChildProcess&) = delete;

    pid_t pid() const { return pid_; }
    void signal(int number) const;

    /// The next line of output without its line feed; none at its end, or when the limit passed without one.
    std::optional<std::string> readLine(std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Reads lines until one holds `text`; false when the output ended or the limit passed without one.
    [[nodiscard]] bool readUntil(std::string_view text,
                                 std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Reads and forgets all further output, so that a program that prints more than anyone reads is never
    /// held up.
    void discardOutput();

    /// What is left of the output, up to its end.
    std::string readAll(std::chrono::milliseconds limit = std::chrono::seconds(30));

    /// Waits for the end: the exit status, or 128 and the number of the signal that ended it.
    int wait();

private:
    bool readMore(std::chrono::steady_clock::time_point deadline);

    pid_t pid_ = -1;
    FileDescriptor output_;
    std::string unread_;
    std::optional<int> status_;
    std::thread discarding_;
};

struct CommandResult {
    int status;
    std::string output; // standard output and standard error
};

/// Runs a program to its end.
CommandResult runCommand(const std::vector<std::string>& command,
                         const std::vector<std::string>& environment = {});

} // namespace tarn
