#include "sound/SystemOutput.h"

#include <algorithm>
#include <cassert>

namespace tarn {

namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

constexpr auto bufferLength = 2s;
constexpr std::size_t mostBytes = 3u << 20; // the server takes four mebibytes at most
constexpr auto fadeLength = 5ms;
constexpr auto serverPatience = 500ms;
constexpr auto streamRetry = 1500ms;
constexpr auto timingRetry = 40ms;
constexpr nanoseconds slowTimingRetry = 1s; // for a device that takes its time to begin
constexpr int mostTimingTries = 25;
constexpr int takingBackTries = 3;
constexpr nanoseconds clockTolerance = 1ms;
constexpr nanoseconds timingMargin = 2ms;
constexpr auto renderingMargin = 25ms; // for rendering a piece and taking it to the server

std::size_t capacityFor(const PcmFormat& format) {
    const auto frames = static_cast<std::size_t>(bufferLength.count()) * format.rate;
    return std::min(frames, mostBytes / format.bytesPerFrame());
}

} // namespace

SystemOutput::SystemOutput(EventLoopThread& loop, SoundServer& server, InterruptionListener& interruptions,
                           OutputListener& listener)
    : loop_(loop),
      server_(server),
      interruptions_(interruptions),
      listener_(listener),
      format_(server.format()),
      capacity_(capacityFor(format_)),
      self_(std::make_shared<SystemOutput*>(this)) {
    server_.add(*this);
    clock_.setRate(format_.rate);
    seekServer();
}

SystemOutput::~SystemOutput() {
    server_.remove(*this);
    interruptions_.streamGone(this);
}

void SystemOutput::later(std::function<void(SystemOutput&)> work) {
    loop_.post([weak = std::weak_ptr(self_), work = std::move(work)] {
        if (const auto self = weak.lock())
            work(**self);
    });
}

std::int64_t SystemOutput::framesIn(nanoseconds time) const {
    return time.count() * format_.rate / 1'000'000'000;
}

// -- The server and its stream.

void SystemOutput::seekServer() {
    mode_ = Mode::waiting;
    patience_ = loop_.at(loop_.now() + serverPatience, [this] {
        if (mode_ == Mode::waiting)
            beginAnew(Mode::silent);
    });
    server_.want(*this);
    if (server_.ready())
        openStream();
}

void SystemOutput::soundServerReady() {
    if (!stream_ && mode_ != Mode::idle)
        openStream();
}

void SystemOutput::openStream() {
    server_.refreshFormat([weak = std::weak_ptr(self_)] {
        if (const auto self = weak.lock())
            (*self)->makeStream();
    });
}

void SystemOutput::makeStream() {
    if (stream_ || mode_ == Mode::idle)
        return;
    const PcmFormat& format = server_.format();
    stream_ = server_.makeStream(format, capacityFor(format), static_cast<SoundStreamListener&>(*this));
}

void SystemOutput::streamReady() {
    later([](SystemOutput& self) { self.adoptStream(); });
}

void SystemOutput::adoptStream() {
    if (!stream_ || !stream_->ready())
        return;
    patience_.reset();
    format_ = stream_->format();
    capacity_ = capacityFor(format_);
    stream_->setDescription(title_, artist_);
    beginAnew(Mode::sounding);
}

// A stream that runs with nothing in it moves on all the same, and what is written then comes too late.
void SystemOutput::beginToSound() {
    if (running_ && corked_ && writeIndex_ > base_) {
        stream_->cork(false);
        corked_ = false;
    }
}

// What was written is lost; what comes next is heard next.
void SystemOutput::beginAnew(Mode mode) {
    const nanoseconds now = loop_.now();
    writeIndex_ = clock_.heard(now);
    clock_.setLimit(writeIndex_);
    if (running_)
        clock_.await(now);
    else
        clock_.stop(now);
    clock_.setRate(format_.rate);
    mode_ = mode;
    base_ = writeIndex_;
    filledTo_ = writeIndex_;
    takenWhileStopped_ = writeIndex_;
    seekNext_ = false;
    placing_ = false;
    latency_ = 0us;
    crossfade_.reset();
    history_.reset(format_, capacity_);
    writableTimer_.reset();
    timingTimer_.reset();
    later([](SystemOutput& self) { self.listener_.outputWasReset(); });
}

void SystemOutput::loseStream() {
    stream_.reset();
    toBeSilent_ = false;
    corked_ = true; // as every stream begins
    interruptions_.streamGone(this);
}

void SystemOutput::soundServerLost() {
    loseStream();
    if (mode_ == Mode::waiting || (mode_ == Mode::sounding && running_))
        beginAnew(Mode::silent);
    else if (mode_ == Mode::sounding)
        beginAnew(Mode::idle);
}

void SystemOutput::streamKilled() {
    later([](SystemOutput& self) {
        self.loseStream();
        if (self.mode_ == Mode::sounding) {
            self.beginAnew(Mode::idle);
            self.listener_.outputDeviceVanished();
        } else { // there is no device at all
            if (self.mode_ == Mode::waiting)
                self.beginAnew(Mode::silent);
            self.patience_ = self.loop_.at(self.loop_.now() + streamRetry, [output = &self] {
                if (!output->stream_ && output->running_ && output->server_.ready())
                    output->openStream();
            });
        }
    });
}

void SystemOutput::streamMovedOffVanishedDevice() {
    stream_->cork(true);
    corked_ = true;
    clock_.await(loop_.now());
    later([](SystemOutput& self) { self.listener_.outputDeviceVanished(); });
}

// A stream that stands still is asked as well, and is kept mute until it is released.
void SystemOutput::streamToBeInterrupted() {
    toBeSilent_ = true;
    if (running_)
        interruptions_.streamInterrupted(this);
}

void SystemOutput::streamToBeReleased() {
    toBeSilent_ = false;
    interruptions_.streamReleased(this);
}

void SystemOutput::setDescription(const std::string& title, const std::string& artist) {
    title_ = title;
    artist_ = artist;
    if (mode_ == Mode::sounding)
        stream_->setDescription(title, artist);
}

// -- Running and standing still.

void SystemOutput::start() {
    running_ = true;
    const nanoseconds now = loop_.now();
    switch (mode_) {
    case Mode::idle:
        clock_.await(now);
        seekServer();
        break;
    case Mode::waiting:
        clock_.await(now);
        break;
    case Mode::silent:
        clock_.run(clock_.heard(now), now);
        server_.want(*this);
        break;
    case Mode::sounding:
        clock_.await(now);
        beginToSound();
        updateTimingSoon();
        break;
    }
    armWritable();
    if (toBeSilent_)
        interruptions_.streamInterrupted(this);
}

void SystemOutput::stop() {
    running_ = false;
    clock_.stop(loop_.now());
    writableTimer_.reset();
    timingTimer_.reset();
    server_.unwant(*this);
    if (mode_ != Mode::sounding)
        return;
    takenWhileStopped_ = firstReplaceable();
    stream_->cork(true);
    corked_ = true;
    stream_->updateTiming();
}

void SystemOutput::updateTimingSoon() {
    timingTries_ = 0;
    stream_->updateTiming();
}

void SystemOutput::streamTimingUpdated() {
    const auto timing = mode_ == Mode::sounding ? stream_->timing() : std::nullopt;
    if (!timing)
        return;
    if (std::exchange(placing_, false))
        base_ = writeIndex_ - timing->writeIndex;
    if (!running_) {
        takenWhileStopped_ = base_ + timing->readIndex;
        return;
    }
    latency_ = std::max(latency_, timing->latency);
    if (timing->playing) {
        const nanoseconds before = timeOfFrame(writeIndex_);
        clock_.run(base_ + timing->readIndex + timing->silence - framesIn(timing->latency), timing->time);
        const nanoseconds moved = timeOfFrame(writeIndex_) - before;
        if (moved > clockTolerance || moved < -clockTolerance)
            listener_.outputClockMoved();
    }
    armWritable();
    if (timing->playing && timing->readIndex > 0 && timingTries_ > 0)
        return;
    timingTimer_ = loop_.at(loop_.now() + pauseBeforeTiming(*timing), [this] { stream_->updateTiming(); });
}

// How long until the next look at a stream of which nothing is heard yet. A device that still plays what it
// took before takes ours when that is over, unless it can take the rest of it back, which it does at once.
nanoseconds SystemOutput::pauseBeforeTiming(const SoundStream::Timing& timing) {
    if (++timingTries_ >= mostTimingTries)
        return slowTimingRetry;
    if (timing.playing || timingTries_ < takingBackTries)
        return timingRetry;
    return std::clamp<nanoseconds>(timing.latency + timingMargin, timingRetry, slowTimingRetry);
}

// -- Writing.

std::size_t SystemOutput::writable() const {
    if (mode_ == Mode::idle || mode_ == Mode::waiting)
        return 0;
    const auto held = static_cast<std::size_t>(writeIndex_ - heardFrame());
    return capacity_ - std::min(held, capacity_);
}

void SystemOutput::write(const PcmBuffer& buffer) {
    assert(buffer.frames <= writable());
    const nanoseconds now = loop_.now();
    const bool standing = clock_.heard(now) >= writeIndex_;
    if (mode_ == Mode::sounding) {
        if (crossfade_.pending()) {
            PcmBuffer blended = buffer;
            crossfade_.apply(blended);
            send(blended, standing);
        } else {
            send(buffer, standing);
        }
    } else if (standing && running_) {
        clock_.run(writeIndex_, now);
    }
    writeIndex_ += static_cast<std::int64_t>(buffer.frames);
    filledTo_ = std::max(filledTo_, writeIndex_);
    clock_.setLimit(writeIndex_);
    if (mode_ == Mode::sounding)
        beginToSound();
    armWritable();
}

void SystemOutput::send(const PcmBuffer& buffer, bool standing) {
    history_.put(writeIndex_, buffer);
    if (standing && running_ && filledTo_ > base_) {
        // Silence is heard behind the last frame by now: go on as soon as can be.
        stream_->writeSoon(static_cast<std::size_t>(framesIn(renderingMargin)), buffer.bytes.data(),
                           buffer.frames);
        filledTo_ = writeIndex_;
        placing_ = true;
    } else if (std::exchange(seekNext_, false)) {
        stream_->writeAt(writeIndex_ - base_, buffer.bytes.data(), buffer.frames);
    } else {
        stream_->write(buffer.bytes.data(), buffer.frames);
    }
    if (standing && running_) {
        clock_.await(loop_.now());
        updateTimingSoon();
    }
}

std::int64_t SystemOutput::firstReplaceable() const {
    const std::int64_t heard = heardFrame();
    if (mode_ != Mode::sounding)
        return std::min(heard, writeIndex_);
    if (placing_)
        return writeIndex_;
    if (!running_)
        return std::clamp(takenWhileStopped_, std::min(heard, writeIndex_), writeIndex_);
    return std::min(heard + framesIn(latency_ + renderingMargin), writeIndex_);
}

void SystemOutput::rewind(std::int64_t index, Join join) {
    assert(index <= writeIndex_);
    if (mode_ == Mode::sounding && index < writeIndex_) {
        if (join == Join::blended) {
            const auto frames = std::min(writeIndex_ - index, framesIn(fadeLength));
            crossfade_.begin(history_.get(index, static_cast<std::size_t>(frames)), format_);
        } else {
            crossfade_.reset();
        }
        silenceFrom(index);
    }
    writeIndex_ = index;
    clock_.setLimit(index);
    armWritable();
}

// Nothing of what was taken back may be heard, even when less is written in its place.
void SystemOutput::silenceFrom(std::int64_t index) {
    const auto frames = static_cast<std::size_t>(filledTo_ - index);
    const std::vector<std::byte> silence(frames * format_.bytesPerFrame());
    stream_->writeAt(index - base_, silence.data(), frames);
    seekNext_ = true;
}

void SystemOutput::armWritable() {
    if (!running_ || writable() >= capacity_ / 2 || mode_ == Mode::waiting) {
        writableTimer_.reset();
        return;
    }
    const std::int64_t half = writeIndex_ - static_cast<std::int64_t>(capacity_ / 2);
    writableTimer_ = loop_.at(clock_.timeOf(half, loop_.now()), [this] {
        if (mode_ == Mode::sounding)
            stream_->updateTiming();
        if (writable() < capacity_ / 2 - static_cast<std::size_t>(framesIn(10ms)))
            armWritable();
        else
            listener_.outputIsWritable();
    });
}

nanoseconds SystemOutput::timeOfFrame(std::int64_t index) const { return clock_.timeOf(index, loop_.now()); }

} // namespace tarn
