#pragma once

#include <functional>
#include <memory>
#include <set>

#include "player/EventLoopThread.h"
#include "sound/SoundLibrary.h"

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
/// half: a paused service wakes up for nothing. Where the module that speaks to it is not installed there is
/// no sound server.
class SoundServer final : private SoundConnectionListener {
public:
    /// `loop` outlives the server, and no longer runs when that is destroyed.
    explicit SoundServer(EventLoopThread& loop);
    ~SoundServer() override;

    /// Loads what speaks to the server, which takes a few milliseconds; the first want() does it otherwise.
    void prepare() { library(); }

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

    /// Only when ready(). `listener` outlives the stream.
    std::unique_ptr<SoundStream> makeStream(const PcmFormat& format, std::size_t bufferFrames,
                                            SoundStreamListener& listener) {
        return connection_->makeStream(format, bufferFrames, listener);
    }

private:
    SoundLibrary* library();
    void connect();
    void connectionReady() override { later(&SoundServer::found); }
    void connectionLost() override { later(&SoundServer::lost); }
    void later(void (SoundServer::*what)());
    void found();
    void lost();
    void retryLater();
    void tell(void (SoundServerListener::*what)());

    EventLoopThread& loop_;
    std::unique_ptr<SoundLibrary> library_; // null before it is needed, and when it is not there
    bool librarySought_ = false;
    std::unique_ptr<SoundConnection> connection_;
    int attempt_ = 0; // which connection it is
    bool ready_ = false;
    bool missed_ = false; // its absence has been logged
    PcmFormat format_;
    std::chrono::milliseconds delay_;
    RegistrationHandle retry_;
    std::set<SoundServerListener*> listeners_;
    std::set<SoundServerListener*> wanting_;
    std::shared_ptr<SoundServer*> self_; // for work that is posted and comes too late
};

} // namespace tarn
