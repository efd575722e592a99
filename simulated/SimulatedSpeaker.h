#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <string>
#include <vector>

#include "player/EventLoop.h"
#include "player/Output.h"
#include "threads/MutexProtected.h"

namespace tarn {

class SimulatedOutput;

/// The sound server and the listener's ears in one: makes outputs, hears what they play, and does to them
/// what a sound server does. Any thread may call.
class SimulatedSpeaker final : public OutputFactory {
public:
    /// A stretch of sound as it was heard.
    struct Heard {
        std::chrono::nanoseconds from; ///< by the clock
        std::chrono::nanoseconds to;
        std::string URL;
        std::chrono::nanoseconds start; ///< of the media
        std::chrono::nanoseconds end;

        /// "10.000-12.500 file:///b 0.000..2.500"
        std::string text() const;
    };

    explicit SimulatedSpeaker(EventLoop& loop) : loop_(loop) {}

    std::unique_ptr<Output> create(OutputListener& listener) override;

    /// How long what has been written last is on its way, and so cannot be taken back; of outputs made from
    /// now on.
    void setLatency(std::chrono::nanoseconds latency) { latency_ = latency; }

    /// From now on what is heard is kept. Off at first: a day of it is long.
    void listen() { listening_ = true; }

    /// Everything heard so far, adjoining stretches joined.
    std::vector<Heard> heard();

    /// How often frames were taken back in the middle of something, so that a blend was asked for.
    std::size_t blends() const { return blends_; }

    /// Every output breaks off and begins anew / loses its device.
    void reset();
    void loseDevice();

    /// Every output goes on without sound because of `error`, or sounds again.
    void tellSound(const std::optional<Error>& error);

    /// Outputs that exist, and those of them that are started.
    std::size_t outputs() const;
    std::size_t soundingOutputs() const;

private:
    friend class SimulatedOutput;

    void hear(Heard heard);
    void remove(SimulatedOutput& output);

    EventLoop& loop_;
    std::atomic<std::chrono::nanoseconds> latency_{std::chrono::nanoseconds(0)};
    std::atomic<bool> listening_ = false;
    std::atomic<std::size_t> blends_ = 0;
    MutexProtected<std::vector<SimulatedOutput*>> outputs_;
    MutexProtected<std::vector<Heard>> heard_;
};

} // namespace tarn
