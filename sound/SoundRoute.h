#pragma once

#include <functional>
#include <memory>
#include <string>

#include "sound/InterruptionListener.h"
#include "sound/SoundServer.h"

namespace tarn {

/// Is told where the sound of an output goes. Player thread, never inside a call of the route.
class SoundRouteListener {
public:
    virtual ~SoundRouteListener() = default;

    /// mode() is another one, or the stream is; what the stream before held is lost.
    virtual void routeChanged() = 0;

    /// The device that sounded is gone.
    virtual void routeDeviceVanished() = 0;

    /// Of the stream, while sounding.
    virtual void routeMoved() = 0;
    virtual void routeTimingUpdated() = 0;
};

/// Where the sound of one output goes: into a stream of the sound server, or nowhere, in silence that keeps
/// time.
///
///             start()                 stream ready
///      idle ──────────────> waiting ───────────────> sounding
///       ^                      │                      │    ^
///       │            no server │   server lost        │    │ stream ready
///       │                      v   while started      │    │
///       │                    silent <─────────────────┘    │
///       │                      └───────────────────────────┘
///       └──── server lost while stopped, or the stream killed
///
/// It gets the stream, and gets it anew when it was lost. While started it also follows whether the sound
/// server, or a phone call, wants silence, and tells the audio session so. Player thread.
class SoundRoute final : private SoundServerListener, private SoundStreamListener {
public:
    enum class Mode : std::uint8_t {
        idle,     ///< stopped, and no server is known
        waiting,  ///< for the server, a moment
        silent,   ///< without a server
        sounding, ///< through stream()
    };

    /// All of these outlive the route.
    SoundRoute(EventLoop& loop, SoundServer& server, InterruptionListener& interruptions,
               SoundRouteListener& listener);
    ~SoundRoute() override;

    Mode mode() const { return mode_; }

    /// Only while sounding.
    SoundStream& stream() const { return *stream_; }

    /// What is missing for sound, while that is not there though it was wanted.
    std::optional<Error> silentBecause() const;

    /// Sound is wanted, or is not any more. Does not touch the stream.
    void start();
    void stop();

    /// The stream goes on until what it holds was heard, though the route ends.
    void playOut();

    void setDescription(const std::string& title, const std::string& artist);

private:
    void soundServerReady() override;
    void soundServerLost() override;
    void callChanged() override { silenceOrRelease(false); }
    void streamReady() override;
    void streamKilled() override;
    void streamDeviceVanished() override;
    void streamMoved() override;
    void streamTimingUpdated() override;
    void streamToBeInterrupted() override;
    void streamToBeReleased() override;

    void seek();
    void openStream();
    void makeStream();
    void adoptStream();
    void loseStream();
    void setMode(Mode mode);
    void silenceOrRelease(bool starting);
    void later(std::function<void(SoundRoute&)> work);

    EventLoop& loop_;
    SoundServer& server_;
    InterruptionListener& interruptions_;
    SoundRouteListener& listener_;

    Mode mode_ = Mode::idle;
    bool started_ = false;
    bool askedForSilence_ = false; // by the server, which has not taken it back
    bool silenced_ = false;        // the session knows
    std::string title_;
    std::string artist_;
    std::unique_ptr<SoundStream> stream_; // also before it is ready
    RegistrationHandle patience_;
    std::shared_ptr<SoundRoute*> self_; // for work that is posted and comes too late
};

} // namespace tarn
