#pragma once

#include <functional>
#include <list>
#include <memory>
#include <set>

#include "player/EventLoopThread.h"
#include "roles/Error.h"
#include "sound/SoundLibrary.h"

namespace tarn {

/// Is told when the sound server comes and goes. Player thread.
class SoundServerListener {
public:
    virtual ~SoundServerListener() = default;

    /// There is a server with a device: streams can be made, in format().
    virtual void soundServerReady() = 0;

    /// It is not there, or not any more; every stream is dead.
    virtual void soundServerLost() = 0;

    /// A phone call began or ended: see call(). Told to those who want to sound.
    virtual void callChanged() = 0;
};

/// The connection to the sound server, one for all outputs. Player thread, but for construction and
/// destruction.
///
/// The server is sought only while somebody wants it, again and again at growing intervals of at most a
/// second and a half, and its devices and calls are watched only then: a paused service wakes up for nothing.
/// Where the module that speaks to it is not installed there is no sound server. A server without a device,
/// or with nothing but the dummy that servers fall back to, is waited for like one that is not there.
class SoundServer final : private SoundConnectionListener {
public:
    /// `loop` outlives the server, and no longer runs when that is destroyed. Whoever starts the process may
    /// choose silence: TARND_SOUND=none in its environment.
    explicit SoundServer(EventLoopThread& loop);
    ~SoundServer() override;

    bool silenceIsChosen() const { return silent_; }

    /// Loads what speaks to the server, which takes a few milliseconds; the first want() does it otherwise.
    void prepare();

    void add(SoundServerListener& listener) { listeners_.insert(&listener); }
    void remove(SoundServerListener& listener);

    /// `listener` wants to sound: the server is sought now, and until it is found.
    void want(SoundServerListener& listener);
    void unwant(SoundServerListener& listener);

    bool ready() const { return connected_ && device_; }

    /// What sound lacks while not ready().
    Error missing() const;

    /// Calls `done` as soon as something can sound, or after `limit` with what is missing. At once when
    /// somebody sounds already, or goes on in silence, or silence is chosen.
    void request(std::chrono::nanoseconds limit, std::function<void(std::optional<Error>)> done);

    /// Whether a phone call goes on, as far as anybody wants to sound.
    bool call() const { return call_; }

    /// Looks up the default device of now, then calls `done`; the server may go before that, and then it is
    /// not called. Only when ready().
    void refreshDevice(std::function<void()> done);

    /// The nearest one to the default device's own. Only when ready().
    const PcmFormat& format() const { return *device_; }

    /// Only when ready(). `listener` outlives the stream.
    std::unique_ptr<SoundStream> makeStream(SoundStreamListener& listener) {
        return connection_->makeStream(*device_, listener);
    }

    /// Keeps a stream that nobody needs any more until what it still holds was heard.
    void playOut(std::unique_ptr<SoundStream> stream);

    /// How long a stream goes on behind its last frame: a clock may be ahead of the ear, and the device slow.
    static constexpr std::chrono::milliseconds timeToPlayOut{400};

private:
    struct Request;
    struct Ending;

    bool wanted() const { return !wanting_.empty() || !requests_.empty(); }
    SoundLibrary* library();
    void seek();
    void connect();
    void connectionReady() override;
    void connectionLost() override;
    void serverSurveyed(const SoundSurvey& survey) override;
    void later(std::function<void(SoundServer&)> work);
    void found();
    void lost();
    void lookForDevice();
    void deviceFound();
    void watchIfWanted();
    void setCall(bool call);
    void retryLater();
    void answerRequests(const std::optional<Error>& error);
    void tell(void (SoundServerListener::*what)());

    EventLoopThread& loop_;
    const bool silent_;
    std::unique_ptr<SoundLibrary> library_; // null before it is needed, and when it is not there
    bool librarySought_ = false;
    std::unique_ptr<SoundConnection> connection_;
    int attempt_ = 0; // which connection it is
    bool connected_ = false;
    bool missed_ = false; // its absence has been logged
    bool watching_ = false;
    bool call_ = false;
    std::optional<PcmFormat> device_;
    std::chrono::milliseconds delay_;
    RegistrationHandle retry_;
    std::set<SoundServerListener*> listeners_;
    std::set<SoundServerListener*> wanting_;
    std::list<Request> requests_;
    std::list<Ending> endings_;
    std::shared_ptr<SoundServer*> self_; // for work that is posted and comes too late
};

} // namespace tarn
