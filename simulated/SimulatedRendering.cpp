#include "simulated/SimulatedRendering.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <utility>

#include "simulated/SimulatedSound.h"

namespace tarn {

SimulatedRendering::SimulatedRendering(std::shared_ptr<SimulatedMediaAsset> asset, EventLoop& loop,
                                       std::function<void()> goesOn)
    : asset_(std::move(asset)), loop_(loop), goesOn_(std::move(goesOn)) {
    for (const MediaScript::Stall& stall : asset_->script().stalls)
        stalls_.push_back({stall, nullptr});
    if (asset_->script().readyAfter <= std::chrono::nanoseconds(0))
        return;
    isOpen_ = false;
    openingTimer_ = loop_.at(loop_.now() + asset_->script().readyAfter, [this] {
        isOpen_ = true;
        goesOn_();
    });
}

Opening SimulatedRendering::opening() const {
    if (!isOpen_)
        return {.done = false, .error = std::nullopt};
    return {.done = true, .error = asset_->script().unplayable};
}

void SimulatedRendering::seek(std::chrono::nanoseconds position, float rate, const PcmFormat&) {
    origin_ = std::clamp(position, std::chrono::nanoseconds(0), asset_->script().duration);
    rate_ = rate;
    rendered_ = 0;
}

std::chrono::nanoseconds SimulatedRendering::position() const {
    double moved = rendered_ * rate_ * static_cast<double>(simulatedFrame.count());
    return origin_ + std::chrono::nanoseconds(std::llround(moved));
}

SimulatedRendering::Obstacle SimulatedRendering::nextObstacle() {
    const MediaScript& script = asset_->script();
    bool backwards = rate_ < 0;
    Obstacle next{backwards ? std::chrono::nanoseconds(0) : script.duration, RenderedSpan::State::ended,
                  nullptr};
    auto consider = [&](const Obstacle& other) {
        bool ahead = backwards ? other.position <= origin_ : other.position >= origin_;
        if (ahead && (backwards ? other.position > next.position : other.position < next.position))
            next = other;
    };
    if (script.breaksAt)
        consider({*script.breaksAt, RenderedSpan::State::failed, nullptr});
    for (Stall& stall : stalls_)
        if (!stall.over)
            consider({stall.script.position, RenderedSpan::State::waiting, &stall});
    return next;
}

void SimulatedRendering::meet(Stall& stall) {
    if (!stall.timer)
        stall.timer = loop_.at(loop_.now() + stall.script.duration, [this, &stall] {
            stall.over = true;
            goesOn_();
        });
}

RenderedSpan SimulatedRendering::render(PcmBuffer& buffer, std::size_t maxFrames) {
    RenderedSpan span;
    span.start = position();
    if (!isOpen_) {
        span.end = span.start;
        span.state = RenderedSpan::State::waiting;
        return span;
    }
    Obstacle obstacle = nextObstacle();
    auto distance = static_cast<double>((obstacle.position - origin_).count());
    double frames = std::ceil(distance / (rate_ * static_cast<double>(simulatedFrame.count()))) - rendered_;
    if (frames > static_cast<double>(maxFrames)) {
        span.frames = maxFrames;
        rendered_ += static_cast<double>(maxFrames);
        span.end = position();
    } else {
        span.frames = static_cast<std::size_t>(std::max(frames, 0.0));
        origin_ = span.end = obstacle.position;
        rendered_ = 0;
        span.state = obstacle.state;
        if (obstacle.stall)
            meet(*obstacle.stall);
        if (span.state == RenderedSpan::State::failed)
            span.error = asset_->script().breakError;
    }
    SimulatedSound sound{asset_.get(), span.start, span.end};
    buffer.frames += span.frames;
    buffer.bytes.resize(sizeof sound);
    std::memcpy(buffer.bytes.data(), &sound, sizeof sound);
    return span;
}

RenderingFactory::Outcome SimulatedRenderingFactory::open(const std::shared_ptr<MediaAsset>& asset,
                                                          std::function<void()> goesOn) {
    auto simulated = std::static_pointer_cast<SimulatedMediaAsset>(asset);
    return {std::make_unique<SimulatedRendering>(std::move(simulated), loop_, std::move(goesOn)),
            std::nullopt};
}

} // namespace tarn
