#pragma once

#include <functional>
#include <memory>
#include <string>

#include <pulse/context.h>
#include <pulse/stream.h>
#include <pulse/thread-mainloop.h>

namespace tarn {

/// A connection to the sound server with a thread of its own. Throws when there is no server.
class PulseThread final {
public:
    PulseThread();
    ~PulseThread();

    PulseThread(const PulseThread&) = delete;
    PulseThread& operator=(const PulseThread&) = delete;

    /// Runs `work` with the thread held off.
    void locked(const std::function<void()>& work);

    /// Waits, within locked(), until the thread has called signal() and `done` holds.
    void wait(const std::function<bool()>& done);
    void signal() { pa_threaded_mainloop_signal(loop_, 0); }

    pa_context* context() const { return context_; }

private:
    pa_threaded_mainloop* loop_;
    pa_context* context_;
};

/// A stream to the null sink, 16 bits, 44,100 Hz, two channels, for as long as it lives.
class PulsePlayer final {
public:
    enum class Kind {
        call,  ///< silence of the role "phone", which interrupts all music
        music, ///< a tone that falls silent and goes on as the server asks it to, and does nothing else
    };

    /// Returns when the server has it.
    PulsePlayer(PulseThread& thread, Kind kind);
    ~PulsePlayer();

    PulsePlayer(const PulsePlayer&) = delete;
    PulsePlayer& operator=(const PulsePlayer&) = delete;

private:
    static void fill(pa_stream* stream, std::size_t size, void* player);
    static void obey(pa_stream* stream, const char* event, pa_proplist* properties, void* player);
    static void tell(pa_stream* stream, void* player);

    PulseThread& thread_;
    const Kind kind_;
    pa_stream* stream_ = nullptr;
};

} // namespace tarn
