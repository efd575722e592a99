#include "player/Timeline.h"

#include <algorithm>
#include <cassert>
#include <cmath>
#include <utility>

namespace tarn {

std::chrono::nanoseconds Timeline::Span::positionAt(std::int64_t frame) const {
    if (frame >= endFrame)
        return end;
    if (frame <= firstFrame)
        return start;
    double share = static_cast<double>(frame - firstFrame) / static_cast<double>(endFrame - firstFrame);
    auto length = static_cast<double>((end - start).count());
    return start + std::chrono::nanoseconds(std::llround(share * length));
}

void Timeline::append(Span span) {
    assert(span.firstFrame <= span.endFrame);
    assert(spans_.empty() || spans_.back().endFrame <= span.firstFrame);
    spans_.push_back(std::move(span));
}

std::optional<std::chrono::nanoseconds> Timeline::positionOf(EntryId entry, std::int64_t frame) const {
    std::optional<std::chrono::nanoseconds> position;
    for (const Span& span : spans_) {
        if (span.entry != entry)
            continue;
        position = span.positionAt(frame);
        if (frame < span.endFrame)
            break;
    }
    return position;
}

const Timeline::Span* Timeline::endOf(EntryId entry) const {
    auto found = std::find_if(spans_.begin(), spans_.end(), [entry](const Span& span) {
        return span.entry == entry && span.ending != End::none;
    });
    return found == spans_.end() ? nullptr : &*found;
}

void Timeline::forgetBefore(std::int64_t frame) {
    while (spans_.size() > 1 && spans_.front().endFrame <= frame)
        spans_.pop_front();
}

void Timeline::cut(std::int64_t frame) {
    while (spans_.size() > 1 && spans_.back().firstFrame >= frame)
        spans_.pop_back();
    if (spans_.empty())
        return;
    Span& last = spans_.back();
    last.end = last.positionAt(frame);
    last.firstFrame = std::min(last.firstFrame, frame);
    last.endFrame = std::min(last.endFrame, frame);
    last.ending = End::none;
    last.error.reset();
}

} // namespace tarn
