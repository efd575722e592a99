#pragma once

#include <cstddef>
#include <memory>
#include <vector>

#include "player/EventLoop.h"
#include "player/Rendering.h"
#include "simulated/SimulatedMediaAsset.h"

namespace tarn {

/// Renders by arithmetic: every rate is played exactly, and every position is right to the nanosecond.
class SimulatedRendering final : public Rendering {
public:
    SimulatedRendering(std::shared_ptr<SimulatedMediaAsset> asset, EventLoop& loop,
                       std::function<void()> goesOn);

    Opening opening() const override;
    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) override;
    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override;

private:
    struct Stall {
        MediaScript::Stall script;
        RegistrationHandle timer;
        bool over = false;
    };

    /// Where playing that way comes to next, and what is there.
    struct Obstacle {
        std::chrono::nanoseconds position;
        RenderedSpan::State state;
        Stall* stall;
    };

    Obstacle nextObstacle();
    void meet(Stall& stall);
    std::chrono::nanoseconds position() const;

    const std::shared_ptr<SimulatedMediaAsset> asset_;
    EventLoop& loop_;
    const std::function<void()> goesOn_;
    bool isOpen_ = true;
    RegistrationHandle openingTimer_;
    std::vector<Stall> stalls_;
    std::chrono::nanoseconds origin_{0};
    double rate_ = 1;
    double rendered_ = 0; ///< frames since `origin_`
};

class SimulatedRenderingFactory final : public RenderingFactory {
public:
    explicit SimulatedRenderingFactory(EventLoop& loop) : loop_(loop) {}

    Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) override;

private:
    EventLoop& loop_;
};

} // namespace tarn
