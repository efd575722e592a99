#pragma once

#include <memory>
#include <string>

#include "player/Output.h"
#include "sound/HeardClock.h"
#include "sound/SoundRoute.h"
#include "sound/StreamClock.h"
#include "sound/StreamWriter.h"

namespace tarn {

/// The output of this machine: one stream to the sound server, or silence that keeps time while there is no
/// server.
///
/// The problem: an output promises that everything that is not heard yet can be changed until shortly before,
/// and that it knows at any time which frame is heard. The sound server has a buffer of its own, tells where
/// it stands only when it is asked, takes frames away to the device that may or may not give them back, and
/// may go and come.
///
/// The idea: four questions, each answered by a class that knows nothing of the others.
///
///     where does the sound go?                    SoundRoute    idle, waiting, silent, sounding
///     where in the stream is a frame?             StreamWriter  writes, takes back, fades over
///     what does the server's report say of now?   StreamClock   a line under its reports
///     which frame is heard?                       HeardClock    asked from any thread, never goes back
///
/// This class joins them, and counts the frames: all that was written lies before writeIndex(), and at most
/// two seconds of it are not heard yet. Whenever the route changes, what was not heard is lost, and
/// everything begins anew at the frame that would have been heard next; the player renders again from there.
///
/// Invariants: heardFrame() <= firstReplaceable() <= writeIndex(). heardFrame() never goes back. Stopped, or
/// with its buffer full, it runs nothing: it wakes up when the buffer is half empty, and asks the server
/// then.
class SystemOutput final : public Output, private SoundRouteListener {
public:
    /// All of these outlive the output.
    SystemOutput(EventLoop& loop, SoundServer& server, InterruptionListener& interruptions,
                 OutputListener& listener);

    /// What the listener has not heard by the clock is not heard any more; but the clock may be a little
    /// ahead, so what was played to its end is played out.
    ~SystemOutput() override;

    PcmFormat format() const override { return format_; }
    void start() override;
    void stop() override;
    std::int64_t writeIndex() const override { return writeIndex_; }
    std::size_t writable() const override;
    void write(const PcmBuffer& buffer) override;
    std::int64_t firstReplaceable() const override;
    void rewind(std::int64_t index, Join join) override;
    std::int64_t heardFrame() const override { return clock_.heard(loop_.now()); }
    std::chrono::nanoseconds timeOfFrame(std::int64_t index) const override;
    void setDescription(const std::string& title, const std::string& artist) override {
        route_.setDescription(title, artist);
    }

private:
    void routeChanged() override;
    void routeDeviceVanished() override;
    void routeMoved() override;
    void routeTimingUpdated() override;

    bool sounding() const { return route_.mode() == SoundRoute::Mode::sounding; }
    bool playedOut() const { return heardFrame() >= writeIndex_; }
    void beginAnew();
    void later(std::function<void(SystemOutput&)> work);
    void tellSilence();
    void letStreamRun();
    void awaitSound();
    void lookIn(std::chrono::nanoseconds pause);
    void followClock(const SoundStream::Timing& timing);
    void tryToTakeBack(const SoundStream::Timing& timing);
    void armWritable();
    std::int64_t framesIn(std::chrono::nanoseconds time) const;

    EventLoop& loop_;
    OutputListener& listener_;
    SoundRoute route_;

    PcmFormat format_;
    std::size_t capacity_ = 0; // frames
    bool running_ = false;
    bool silenceTold_ = false;
    bool corked_ = true; // the stream: it stands still whether this runs or not
    std::int64_t writeIndex_ = 0;
    HeardClock clock_;

    // Of the stream, while there is one.
    StreamWriter writer_;
    StreamClock streamClock_;
    std::int64_t takenWhileStopped_ = 0; // what had left for the device when the stream was stopped
    int waitsForSound_ = 0;              // looks at the stream since something should be heard of it
    bool triedToTakeBack_ = false;

    RegistrationHandle writableTimer_;
    RegistrationHandle lookTimer_;
    RegistrationHandle corkTimer_;        // while a stream plays out
    std::shared_ptr<SystemOutput*> self_; // for reports that are posted and come too late
};

/// Outputs of this machine. Player thread.
class SystemOutputFactory final : public OutputFactory {
public:
    /// All of these outlive the factory, and the factory its outputs. Lives and dies off the player thread,
    /// while that does nothing for it.
    SystemOutputFactory(EventLoop& loop, SoundServer& server, InterruptionListener& interruptions)
        : loop_(loop), interruptions_(interruptions), server_(server) {}

    void prepare() override { server_.prepare(); }
    std::unique_ptr<Output> create(OutputListener& listener) override {
        return std::make_unique<SystemOutput>(loop_, server_, interruptions_, listener);
    }

private:
    EventLoop& loop_;
    InterruptionListener& interruptions_;
    SoundServer& server_;
};

} // namespace tarn
