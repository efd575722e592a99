#pragma once

#include <deque>
#include <mutex>

#include "player/EventLoop.h"
#include "player/Output.h"
#include "simulated/SimulatedSpeaker.h"

namespace tarn {

/// Two seconds of buffer and a clock that is computed from the loop's.
class SimulatedOutput final : public Output {
public:
    SimulatedOutput(SimulatedSpeaker& speaker, EventLoop& loop, OutputListener& listener,
                    std::chrono::nanoseconds latency);
    ~SimulatedOutput() override;

    PcmFormat format() const override;
    void start() override;
    void stop() override;
    std::int64_t writeIndex() const override;
    std::size_t writable() const override;
    void write(const PcmBuffer& buffer) override;
    std::int64_t firstReplaceable() const override;
    void rewind(std::int64_t index, Join join) override;
    std::int64_t heardFrame() const override;
    std::chrono::nanoseconds timeOfFrame(std::int64_t index) const override;
    void setDescription(const std::string&, const std::string&) override {}

    // For the speaker.
    void reset();
    void loseDevice() { listener_.outputDeviceVanished({"SimulatedSound", 3, {}}); }
    void tellSound(const std::optional<Error>& error) { listener_.outputSoundChanged(error); }
    bool sounding() const;
    void passOnHeard();

private:
    struct Sound {
        std::int64_t first;
        std::int64_t end;
        std::string URL;
        std::chrono::nanoseconds start;
        std::chrono::nanoseconds finish;

        std::chrono::nanoseconds positionAt(std::int64_t frame) const;
    };

    std::int64_t heard() const;
    std::chrono::nanoseconds timeOf(std::int64_t index) const;
    void settleHeard();
    void takeBack(std::int64_t index);
    void setWritableTimer();

    SimulatedSpeaker& speaker_;
    EventLoop& loop_;
    OutputListener& listener_;
    const std::int64_t latency_;

    mutable std::mutex mutex_; // everything but the timer
    bool running_ = false;
    std::int64_t baseFrame_ = 0; // heard at `baseTime_`
    std::chrono::nanoseconds baseTime_{0};
    std::int64_t writeIndex_ = 0;
    std::deque<Sound> sounds_; // not heard yet

    RegistrationHandle writableTimer_;
    RegistrationHandle resetReport_;
};

} // namespace tarn
