#include "media/ChildRendering.h"

#include <algorithm>
#include <bit>
#include <utility>

#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;
using What = RingReader::Taken::What;

constexpr auto longestWait = 10s;
constexpr std::uint32_t partsOfASecond = 2; // that are waited for together, once something is there

Error broken() { return mediaError(MediaErrorCode::damaged, "The file broke its decoder."); }

} // namespace

ChildRendering::ChildRendering(EventLoopThread& loop, MediaProcess& process, Renderer renderer,
                               std::optional<nanoseconds> length, std::function<void()> goesOn,
                               std::function<std::optional<Renderer>()> another)
    : loop_(loop),
      process_(process),
      child_(std::move(renderer.child)),
      ring_(std::move(renderer.ring)),
      length_(length),
      goesOn_(std::move(goesOn)),
      another_(std::move(another)) {
    beginWait();
}

Opening ChildRendering::opening() const {
    if (wasOpened_) // what goes wrong later is told by a span
        return {};
    return {.done = error_.has_value(), .error = error_};
}

void ChildRendering::seek(nanoseconds position, float rate, const PcmFormat& format) {
    format_ = format;
    rate_ = rate;
    position_ = std::clamp(position, 0ns, length_.value_or(nanoseconds::max()));
    ended_ = false;
    waited_ = false;
    reason_.reset();
    if (opened_)
        endWait();
    askToSeek();
}

/// What comes from here on begins at the position that was reached.
void ChildRendering::askToSeek() {
    ring_.begin(++generation_, format_);
    Seek request;
    request.generation = generation_;
    request.position = position_.count();
    request.rate = std::bit_cast<std::uint32_t>(rate_);
    request.format = FormatRecord::of(format_);
    request.capacity = RingMemory::capacityFor(format_);
    if (child_ && child_->channel().send(request) != Channel::Result::done)
        gone_ = true;
}

RenderedSpan ChildRendering::render(PcmBuffer& buffer, std::size_t maxFrames) {
    if (ended_)
        return emptySpan(RenderedSpan::State::ended);
    if (opened_ && !error_) {
        const RingReader::Taken taken = takeFromRing(buffer, maxFrames);
        if (taken.what == What::span)
            return spanOf(taken.span);
        if (taken.what == What::lie)
            fail(broken());
        else if (gone_)
            settleLoss();
        else
            beginWait();
    }
    if (!error_)
        return emptySpan(RenderedSpan::State::waiting);
    RenderedSpan failure = emptySpan(RenderedSpan::State::failed);
    failure.error = error_;
    return failure;
}

RingReader::Taken ChildRendering::takeFromRing(PcmBuffer& buffer, std::size_t maxFrames) {
    RingReader::Taken taken = ring_.take(buffer, maxFrames);
    if (taken.what == What::nothing && !gone_ && !watch_) {
        ring_.want(std::exchange(waited_, true) ? format_.rate / partsOfASecond : maxFrames);
        ++wordsWanted_;
        taken = ring_.take(buffer, maxFrames); // it may have come meanwhile
    }
    if (taken.what == What::span) {
        anew_ = false;
        endWait();
    }
    const bool hasRoom = taken.what == What::nothing || ring_.hasTakenHalf();
    if (hasRoom && child_ && child_->channel().send(Taken{}) == Channel::Result::gone)
        gone_ = true;
    return taken;
}

/// Spans join, and lie within the media, whatever the child says of them.
RenderedSpan ChildRendering::spanOf(const MediaSpan& span) {
    RenderedSpan rendered = emptySpan(RenderedSpan::State::more);
    rendered.frames = span.frames;
    const nanoseconds end(span.end);
    position_ = rate_ < 0 ? std::min(position_, end)
                          : std::clamp(end, position_, std::max(position_, length_.value_or(end)));
    rendered.end = position_;
    if (span.state == MediaSpan::State::ended) {
        ended_ = true;
        rendered.state = RenderedSpan::State::ended;
    } else if (span.state == MediaSpan::State::failed) {
        readMessages();
        fail(reason_.value_or(broken()));
        rendered.state = RenderedSpan::State::failed;
        rendered.error = error_;
    }
    return rendered;
}

RenderedSpan ChildRendering::emptySpan(RenderedSpan::State state) const {
    RenderedSpan span;
    span.start = position_;
    span.end = position_;
    span.state = state;
    return span;
}

/// The child is gone. True when the item has failed with it, false while something is still to come.
bool ChildRendering::settleLoss() {
    if (lossAlarm_ || beginAnew())
        return false;
    if (!std::exchange(lossWasSeen_, true)) {
        endWait();
        lossAlarm_ = loop_.at(loop_.now() + MediaChild::parentEndsWithin, [this] {
            lossAlarm_.reset();
            if (settleLoss())
                goesOn_();
        });
        return false;
    }
    fail(broken());
    return true;
}

/// False when the child has ended by itself, or there is no other.
bool ChildRendering::beginAnew() {
    if (!child_ || !child_->endedWithItsParent(0ms) || std::exchange(anew_, true))
        return false;
    auto next = another_();
    if (!next)
        return false;
    endWait();
    child_ = std::move(next->child);
    ring_ = std::move(next->ring);
    lossWasSeen_ = false;
    gone_ = false;
    opened_ = false;
    wordsWanted_ = 0;
    wordsGiven_ = 0;
    if (generation_ > 0)
        askToSeek();
    beginWait();
    return true;
}

void ChildRendering::beginWait() {
    if (watch_)
        return;
    watch_ = loop_.watch(child_->channel().socket(), [this] { wordIsThere(); });
    alarm_ = loop_.at(loop_.now() + longestWait, [this] { childIsLate(); });
}

void ChildRendering::endWait() {
    ring_.wantNothing();
    watch_.reset();
    alarm_.reset();
}

void ChildRendering::wordIsThere() {
    if (!readMessages())
        return;
    endWait();
    goesOn_();
}

void ChildRendering::childIsLate() {
    process_.renew(); // if it is the parent that is stuck, the next one is not
    fail(mediaError(MediaErrorCode::timedOut, "The file did not answer in time."));
    goesOn_();
}

/// True when the player can go on.
bool ChildRendering::readMessages() {
    bool news = false;
    ReceivedMessage message;
    while (child_ && !gone_) {
        const Channel::Result result = child_->channel().receiveNow(message);
        if (result == Channel::Result::notNow)
            return news;
        news = true;
        if (result == Channel::Result::gone)
            gone_ = true;
        else if (result == Channel::Result::broken || !isTrue(message))
            fail(broken());
    }
    if (!gone_ || opened_ || error_)
        return true;
    return settleLoss();
}

/// Takes note of what the child says; false when it cannot be, and then nothing that it says counts.
bool ChildRendering::isTrue(const ReceivedMessage& message) {
    if (message.as<More>())
        return ++wordsGiven_ <= wordsWanted_;
    if (const auto failure = message.as<RenderingFailed>()) {
        const bool first = failure->generation != generation_ || !reason_;
        if (failure->generation == generation_)
            reason_ = failure->error.toError();
        return first && failure->generation <= generation_;
    }
    const auto answer = message.as<ItemOpened>();
    if (!answer || opened_)
        return false;
    process_.noteLocks(answer->locks);
    opened_ = answer->error.code == 0;
    wasOpened_ = wasOpened_ || opened_;
    if (!opened_)
        fail(answer->error.toError());
    return true;
}

void ChildRendering::fail(Error error) {
    endWait();
    error_ = std::move(error);
    child_.reset();
}

} // namespace tarn
