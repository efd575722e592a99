#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>

namespace tarn {

/// Hears when the null sink begins and ceases to sound. Silence is a hundredth of a second of zeros.
class Hearing final {
public:
    using Time = std::chrono::steady_clock::time_point;

    /// Returns when it hears.
    Hearing();
    ~Hearing();

    Hearing(const Hearing&) = delete;
    Hearing& operator=(const Hearing&) = delete;

    /// Waits until it is so; when that was first heard. Throws when that takes too long.
    Time waitFor(bool sound);

private:
    enum class Heard { nothingYet, silence, sound };

    void run();
    void note(Heard heard);

    std::mutex mutex_;
    std::condition_variable changed_;
    Heard heard_ = Heard::nothingYet;
    Time since_;
    bool ending_ = false;
    std::thread thread_;
};

} // namespace tarn
