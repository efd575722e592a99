#pragma once

#include <functional>
#include <memory>
#include <set>

#include "platform/core/media/PcmFormat.h"
#include "platform/linux/media/LinuxPlayerLoop.h"

struct pa_context;
struct pa_sink_info;

namespace tarn {

/// Is told when the sound server comes and goes. Player thread.
class SoundServerListener {
public:
    virtual ~SoundServerListener() = default;

    /// Streams can be made, in format().
    virtual void soundServerReady() = 0;

    /// It is not there, or not any more; every stream is dead.
    virtual void soundServerLost() = 0;
};

/// The connection to the sound server, one for all outputs. Player thread.
///
/// It is sought only while somebody wants it, again and again at growing intervals of at most a second and a
/// half: a paused service wakes up for nothing.
class SoundServer {
public:
    explicit SoundServer(LinuxPlayerLoop& loop);
    ~SoundServer();

    void add(SoundServerListener& listener) { listeners_.insert(&listener); }
    void remove(SoundServerListener& listener);

    /// `listener` wants to sound: the server is sought now, and until it is found.
    void want(SoundServerListener& listener);
    void unwant(SoundServerListener& listener) { wanting_.erase(&listener); }

    bool ready() const { return ready_; }

    /// Looks up the format of the device that is the default now, then calls `done`; the server may go before
    /// that, and then it is not called.
    void refreshFormat(std::function<void()> done);

    /// The nearest one to the default device's own.
    const PcmFormat& format() const { return format_; }

    /// Null when not connected.
    pa_context* context() const { return context_.get(); }

private:
    struct ContextDelete {
        void operator()(pa_context* context) const;
    };
    struct FormatQuery;

    void connect();
    void stateChanged();
    void found();
    void lost();
    void retryLater();
    void tell(void (SoundServerListener::*what)());

    LinuxPlayerLoop& loop_;
    std::unique_ptr<pa_context, ContextDelete> context_;
    bool ready_ = false;
    bool missed_ = false; // its absence has been logged
    PcmFormat format_;
    std::chrono::milliseconds delay_;
    RegistrationHandle retry_;
    std::set<SoundServerListener*> listeners_;
    std::set<SoundServerListener*> wanting_;
    std::shared_ptr<SoundServer*> self_; // null inside once the server object is gone
};

} // namespace tarn
