#pragma once

#include <memory>
#include <string>

#include "pcm/Crossfade.h"
#include "pcm/FrameHistory.h"
#include "player/Output.h"
#include "sound/HeardClock.h"
#include "sound/InterruptionListener.h"
#include "sound/SoundServer.h"
#include "sound/SoundStream.h"

namespace tarn {

/// One stream to the sound server, or silence that keeps time while there is no server.
///
/// Between the two it changes by itself: when the server goes it goes on in silence, and when the server is
/// back it sounds again from where it is by then.
class SystemOutput final : public Output, private SoundServerListener, private SoundStreamListener {
public:
    /// All of these outlive the output.
    SystemOutput(EventLoopThread& loop, SoundServer& server, InterruptionListener& interruptions,
                 OutputListener& listener);
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
    void setDescription(const std::string& title, const std::string& artist) override;

private:
    enum class Mode {
        idle,     ///< stopped, and no server is known
        waiting,  ///< for the server, a moment
        silent,   ///< no server
        sounding, ///< through stream_
    };

    void soundServerReady() override;
    void soundServerLost() override;
    void streamReady() override;
    void streamKilled() override;
    void streamMovedOffVanishedDevice() override;
    void streamTimingUpdated() override;
    void streamToBeInterrupted() override;
    void streamToBeReleased() override;

    void seekServer();
    void openStream();
    void makeStream();
    void adoptStream();
    void loseStream();
    void beginAnew(Mode mode);
    void beginToSound();
    void updateTimingSoon();
    std::chrono::nanoseconds pauseBeforeTiming(const SoundStream::Timing& timing);
    void send(const PcmBuffer& buffer, bool standing);
    void silenceFrom(std::int64_t index);
    void armWritable();
    void later(std::function<void(SystemOutput&)> work);
    std::int64_t framesIn(std::chrono::nanoseconds time) const;

    EventLoopThread& loop_;
    SoundServer& server_;
    InterruptionListener& interruptions_;
    OutputListener& listener_;

    PcmFormat format_;
    std::size_t capacity_ = 0; // frames
    Mode mode_ = Mode::idle;
    bool running_ = false;
    bool corked_ = true;      // the stream: it stands still whether we run or not
    bool toBeSilent_ = false; // the server has asked for silence and not taken it back
    std::int64_t writeIndex_ = 0;
    HeardClock clock_;
    FrameHistory history_;
    Crossfade crossfade_;
    std::string title_;
    std::string artist_;

    // Of the stream. Its frame s is the output's frame base_ + s.
    std::unique_ptr<SoundStream> stream_;
    std::int64_t base_ = 0;
    std::int64_t filledTo_ = 0;          // where the server has frames, of ours or of silence
    bool seekNext_ = false;              // the next write begins elsewhere than where the last one ended
    bool placing_ = false;               // base_ is known again with the next timing
    std::int64_t takenWhileStopped_ = 0; // what the server had taken when it was stopped
    std::chrono::microseconds latency_{0};
    int timingTries_ = 0;

    RegistrationHandle writableTimer_;
    RegistrationHandle timingTimer_;
    RegistrationHandle patience_;
    std::shared_ptr<SystemOutput*> self_; // for work that is posted and comes too late
};

/// Outputs of this machine. Player thread.
class SystemOutputFactory final : public OutputFactory {
public:
    /// Both outlive the factory, and the factory its outputs. Lives and dies off the player thread, while
    /// that does nothing for it.
    SystemOutputFactory(EventLoopThread& loop, InterruptionListener& interruptions)
        : loop_(loop), interruptions_(interruptions), server_(loop) {}

    void prepare() override { server_.prepare(); }
    std::unique_ptr<Output> create(OutputListener& listener) override {
        return std::make_unique<SystemOutput>(loop_, server_, interruptions_, listener);
    }

private:
    EventLoopThread& loop_;
    InterruptionListener& interruptions_;
    SoundServer server_;
};

} // namespace tarn
