#pragma once

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A real sound server of the test's own: one null sink, "out", of 16 bits, 44,100 Hz, two channels. The
/// test's process talks to it from now on.
class SoundServerProcess {
public:
    /// `modules` are loaded behind the sink.
    explicit SoundServerProcess(std::vector<std::string> modules = {});
    ~SoundServerProcess() { kill(); }

    void start();
    void kill();

    /// Runs `pactl` with these arguments and returns what it prints.
    std::string control(const std::vector<std::string>& arguments) const;

    std::vector<std::string> environment() const;

private:
    const std::vector<std::string> modules_;
    TemporaryFolder folder_;
    std::unique_ptr<ChildProcess> process_;
};

/// Records what the sink "out" plays, from construction on.
class Recorder {
public:
    Recorder();
    ~Recorder();

    /// All samples until now.
    std::vector<std::int16_t> samples() const;

    std::size_t frames() const;

    /// Waits until so many more frames have been recorded.
    void waitFrames(std::size_t frames) const;

private:
    void run();

    std::atomic<bool> ending_{false};
    mutable std::mutex mutex_;
    mutable std::condition_variable grown_;
    std::vector<std::int16_t> samples_;
    std::atomic<bool> started_{false};
    std::thread thread_;
};

} // namespace tarn
