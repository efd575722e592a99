#include "sound/SystemOutput.h"

#include <algorithm>
#include <cassert>
#include <utility>

#include "sound/SoundError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

constexpr std::size_t silenceSeconds = 2; // are held where no stream is
constexpr nanoseconds clockTolerance = 1ms;

// For rendering a piece and taking it to the server.
constexpr nanoseconds renderingMargin = 20ms;

// Until something is heard of a stream: a few quick looks, then as its device lets expect, then now and then.
constexpr nanoseconds pauseBeforeSound = 40ms;
constexpr nanoseconds longestPauseBeforeSound = 1s;
constexpr nanoseconds timingMargin = 2ms;
constexpr int quickLooks = 3;
constexpr int patientLooks = 25;

} // namespace

SystemOutput::SystemOutput(EventLoop& loop, SoundServer& server, InterruptionListener& interruptions,
                           OutputListener& listener)
    : loop_(loop),
      listener_(listener),
      route_(loop, server, interruptions, *this),
      self_(std::make_shared<SystemOutput*>(this)) {
    if (server.ready())
        format_ = server.format();
    capacity_ = silenceSeconds * format_.rate;
    clock_.setRate(format_.rate);
}

SystemOutput::~SystemOutput() {
    if (writeIndex_ > 0 && playedOut() && (running_ || corkTimer_))
        route_.playOut();
}

std::int64_t SystemOutput::framesIn(nanoseconds time) const {
    return time.count() * format_.rate / 1'000'000'000;
}

// -- Where the sound goes.

void SystemOutput::routeChanged() {
    capacity_ = silenceSeconds * format_.rate;
    if (sounding()) {
        format_ = route_.stream().format();
        capacity_ = route_.stream().capacity();
    }
    corked_ = true; // as every stream begins
    beginAnew();
    tellSilence();
}

// What was written is lost; what comes next is heard next.
void SystemOutput::beginAnew() {
    const nanoseconds now = loop_.now();
    writeIndex_ = clock_.heard(now);
    clock_.setLimit(writeIndex_);
    if (running_)
        clock_.await(now);
    else
        clock_.stop(now);
    clock_.setRate(format_.rate);
    if (sounding())
        writer_.attach(route_.stream(), writeIndex_, capacity_);
    else
        writer_.detach();
    streamClock_.reset(format_.rate);
    takenWhileStopped_ = writeIndex_;
    triedToTakeBack_ = false;
    writableTimer_.reset();
    lookTimer_.reset();
    corkTimer_.reset();
    later([](SystemOutput& self) { self.listener_.outputWasReset(); });
}

void SystemOutput::later(std::function<void(SystemOutput&)> work) {
    loop_.post([weak = std::weak_ptr(self_), work = std::move(work)] {
        if (const auto self = weak.lock())
            work(**self);
    });
}

void SystemOutput::tellSilence() {
    const auto reason = running_ ? route_.silentBecause() : std::nullopt;
    if (reason || silenceTold_)
        listener_.outputSoundChanged(reason);
    silenceTold_ = reason.has_value();
}

// Nothing is to come out of the device that the server has put in its place.
void SystemOutput::routeDeviceVanished() {
    if (sounding() && running_) {
        route_.stream().cork(true);
        corked_ = true;
        clock_.await(loop_.now());
    }
    listener_.outputDeviceVanished(soundError(SoundErrorCode::deviceGone));
}

void SystemOutput::routeMoved() {
    triedToTakeBack_ = false;
    if (running_)
        awaitSound();
}

// -- Running and standing still.

void SystemOutput::start() {
    corkTimer_.reset();
    running_ = true;
    route_.start();
    if (sounding()) {
        letStreamRun();
        awaitSound();
    } else if (route_.mode() == SoundRoute::Mode::silent) {
        const nanoseconds now = loop_.now();
        clock_.run(clock_.heard(now), now);
        later([](SystemOutput& self) {
            self.tellSilence();
            self.listener_.outputIsWritable(); // which it was not before this start
        });
    } else {
        clock_.await(loop_.now());
    }
    armWritable();
}

void SystemOutput::stop() {
    const bool end = playedOut();
    takenWhileStopped_ = firstReplaceable();
    running_ = false;
    clock_.stop(loop_.now());
    writableTimer_.reset();
    lookTimer_.reset();
    route_.stop();
    if (!sounding())
        return;
    if (end) {
        corkTimer_ = loop_.at(loop_.now() + SoundServer::timeToPlayOut, [this] {
            corkTimer_.reset();
            route_.stream().cork(true);
            corked_ = true;
        });
    } else {
        route_.stream().cork(true);
        corked_ = true;
        route_.stream().updateTiming();
    }
}

// A stream that runs with nothing in it moves on all the same, and what is written then comes too late.
void SystemOutput::letStreamRun() {
    if (!running_ || !corked_ || writer_.empty())
        return;
    route_.stream().cork(false);
    corked_ = false;
}

// -- What the server says.

void SystemOutput::awaitSound() {
    clock_.await(loop_.now());
    streamClock_.reset(format_.rate);
    waitsForSound_ = 0;
    route_.stream().updateTiming();
}

void SystemOutput::lookIn(nanoseconds pause) {
    lookTimer_ = loop_.at(loop_.now() + pause, [this] { route_.stream().updateTiming(); });
}

void SystemOutput::routeTimingUpdated() {
    const auto timing = route_.stream().timing();
    if (!timing)
        return;
    writer_.place(*timing, writeIndex_);
    if (!running_) {
        takenWhileStopped_ = writer_.base() + timing->readIndex;
        return;
    }
    if (timing->playing && timing->readIndex > 0) {
        followClock(*timing);
        tryToTakeBack(*timing);
        return;
    }
    // A device that still plays what it took before takes ours when that is over, unless it can take the rest
    // of that back, which it does at once.
    if (++waitsForSound_ > patientLooks)
        lookIn(longestPauseBeforeSound);
    else if (waitsForSound_ < quickLooks)
        lookIn(pauseBeforeSound);
    else
        lookIn(std::clamp<nanoseconds>(timing->latency + timingMargin, pauseBeforeSound,
                                       longestPauseBeforeSound));
}

void SystemOutput::followClock(const SoundStream::Timing& timing) {
    const std::int64_t taken = writer_.base() + timing.readIndex;
    streamClock_.add({taken + timing.silence - framesIn(timing.latency), taken, timing.time});
    const nanoseconds before = timeOfFrame(writeIndex_);
    clock_.run(streamClock_.heardAt(timing.time), timing.time);
    const nanoseconds moved = timeOfFrame(writeIndex_) - before;
    if (moved > clockTolerance || moved < -clockTolerance)
        listener_.outputClockMoved();
    armWritable();
    if (const auto pause = streamClock_.pauseBeforeNext())
        lookIn(*pause);
}

// Once for each device, as soon as it holds enough: whether it gives back what has left for it.
void SystemOutput::tryToTakeBack(const SoundStream::Timing& timing) {
    if (triedToTakeBack_ || route_.stream().takesBack() != SoundStream::TakesBack::unknown)
        return;
    const std::int64_t from = heardFrame() + framesIn(renderingMargin);
    const std::int64_t taken = std::min(writer_.base() + timing.readIndex, writeIndex_);
    if (!writer_.placed() || from + framesIn(timingMargin) >= taken)
        return;
    triedToTakeBack_ = true;
    writer_.writeAgain(from, writeIndex_);
    route_.stream().updateTiming();
}

// -- Writing.

std::size_t SystemOutput::writable() const {
    if (!sounding() && route_.mode() != SoundRoute::Mode::silent)
        return 0;
    const auto held = static_cast<std::size_t>(writeIndex_ - heardFrame());
    return capacity_ - std::min(held, capacity_);
}

void SystemOutput::write(const PcmBuffer& buffer) {
    assert(buffer.frames <= writable());
    const nanoseconds now = loop_.now();
    const bool late = running_ && clock_.heard(now) >= writeIndex_;
    if (!sounding()) {
        if (late)
            clock_.run(writeIndex_, now);
    } else if (late) {
        writer_.writeLate(writeIndex_, buffer, static_cast<std::size_t>(framesIn(renderingMargin)));
    } else {
        writer_.write(writeIndex_, buffer);
    }
    writeIndex_ += static_cast<std::int64_t>(buffer.frames);
    clock_.setLimit(writeIndex_);
    if (sounding()) {
        letStreamRun();
        if (late)
            awaitSound();
    }
    armWritable();
}

std::int64_t SystemOutput::firstReplaceable() const {
    const std::int64_t heard = std::min(heardFrame(), writeIndex_);
    if (!sounding())
        return heard;
    if (!writer_.placed())
        return writeIndex_;
    if (!running_)
        return std::clamp(takenWhileStopped_, heard, writeIndex_);
    std::int64_t first = heard + framesIn(renderingMargin);
    if (route_.stream().takesBack() != SoundStream::TakesBack::yes)
        first += streamClock_.depth();
    return std::min(first, writeIndex_);
}

void SystemOutput::rewind(std::int64_t index, Join join) {
    assert(index <= writeIndex_);
    if (sounding() && index < writeIndex_)
        writer_.takeBack(index, writeIndex_, join);
    writeIndex_ = index;
    clock_.setLimit(index);
    armWritable();
}

void SystemOutput::armWritable() {
    const bool keepsTime = sounding() || route_.mode() == SoundRoute::Mode::silent;
    if (!running_ || writable() >= capacity_ / 2 || !keepsTime) {
        writableTimer_.reset();
        return;
    }
    const std::int64_t half = writeIndex_ - static_cast<std::int64_t>(capacity_ / 2);
    writableTimer_ = loop_.at(clock_.timeOf(half, loop_.now()), [this] {
        if (sounding())
            route_.stream().updateTiming();
        if (writable() < capacity_ / 2 - static_cast<std::size_t>(framesIn(10ms)))
            armWritable();
        else
            listener_.outputIsWritable();
    });
}

nanoseconds SystemOutput::timeOfFrame(std::int64_t index) const { return clock_.timeOf(index, loop_.now()); }

} // namespace tarn
