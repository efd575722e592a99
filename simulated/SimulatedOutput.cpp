#include "simulated/SimulatedOutput.h"

#include <algorithm>
#include <cassert>
#include <cmath>
#include <cstring>
#include <utility>

#include "simulated/SimulatedMediaAsset.h"
#include "simulated/SimulatedSound.h"

namespace tarn {

namespace {

constexpr std::int64_t capacity = 2 * std::int64_t{simulatedFormat.rate};

} // namespace

SimulatedOutput::SimulatedOutput(SimulatedSpeaker& speaker, EventLoop& loop, OutputListener& listener,
                                 std::chrono::nanoseconds latency)
    : speaker_(speaker), loop_(loop), listener_(listener), latency_(latency / simulatedFrame) {}

SimulatedOutput::~SimulatedOutput() {
    stop();
    speaker_.remove(*this);
}

PcmFormat SimulatedOutput::format() const { return simulatedFormat; }

std::int64_t SimulatedOutput::heard() const {
    std::int64_t passed = running_ ? (loop_.now() - baseTime_) / simulatedFrame : 0;
    return std::min(writeIndex_, baseFrame_ + passed);
}

std::int64_t SimulatedOutput::heardFrame() const {
    std::lock_guard lock(mutex_);
    return heard();
}

std::int64_t SimulatedOutput::writeIndex() const {
    std::lock_guard lock(mutex_);
    return writeIndex_;
}

std::size_t SimulatedOutput::writable() const {
    std::lock_guard lock(mutex_);
    return static_cast<std::size_t>(std::max<std::int64_t>(0, capacity - (writeIndex_ - heard())));
}

std::int64_t SimulatedOutput::firstReplaceable() const {
    std::lock_guard lock(mutex_);
    return std::min(writeIndex_, heard() + (running_ ? latency_ : 0));
}

std::chrono::nanoseconds SimulatedOutput::timeOf(std::int64_t index) const {
    return (running_ ? baseTime_ : loop_.now()) + (index - baseFrame_) * simulatedFrame;
}

std::chrono::nanoseconds SimulatedOutput::timeOfFrame(std::int64_t index) const {
    std::lock_guard lock(mutex_);
    return timeOf(index);
}

bool SimulatedOutput::sounding() const {
    std::lock_guard lock(mutex_);
    return running_;
}

void SimulatedOutput::start() {
    {
        std::lock_guard lock(mutex_);
        if (!std::exchange(running_, true))
            baseTime_ = loop_.now();
    }
    setWritableTimer();
}

void SimulatedOutput::stop() {
    writableTimer_.reset();
    std::lock_guard lock(mutex_);
    settleHeard();
    running_ = false;
}

/// What has been heard so far is passed on, and the clock goes on from here.
void SimulatedOutput::settleHeard() {
    std::int64_t now = heard();
    while (running_ && !sounds_.empty() && sounds_.front().first < now) {
        Sound& sound = sounds_.front();
        std::int64_t end = std::min(sound.end, now);
        speaker_.hear({timeOf(sound.first), timeOf(end), sound.URL, sound.start, sound.positionAt(end)});
        sound.start = sound.positionAt(end);
        sound.first = end;
        if (sound.first == sound.end)
            sounds_.pop_front();
    }
    if (running_)
        baseTime_ = now == writeIndex_ ? loop_.now() : timeOf(now);
    baseFrame_ = now;
}

void SimulatedOutput::passOnHeard() {
    std::lock_guard lock(mutex_);
    settleHeard();
}

std::chrono::nanoseconds SimulatedOutput::Sound::positionAt(std::int64_t frame) const {
    if (frame >= end)
        return finish;
    double share = static_cast<double>(frame - first) / static_cast<double>(end - first);
    return start +
           std::chrono::nanoseconds(std::llround(share * static_cast<double>((finish - start).count())));
}

void SimulatedOutput::write(const PcmBuffer& buffer) {
    assert(buffer.frames <= writable());
    SimulatedSound sound{};
    std::memcpy(&sound, buffer.bytes.data(), sizeof sound);
    {
        std::lock_guard lock(mutex_);
        settleHeard();
        std::int64_t end = writeIndex_ + static_cast<std::int64_t>(buffer.frames);
        sounds_.push_back({writeIndex_, end, sound.asset->URL(), sound.start, sound.end});
        writeIndex_ = end;
    }
    setWritableTimer();
}

void SimulatedOutput::rewind(std::int64_t index, Join join) {
    if (join == Join::blended)
        ++speaker_.blends_;
    {
        std::lock_guard lock(mutex_);
        assert(index <= writeIndex_);
        settleHeard();
        takeBack(index);
        if (index < baseFrame_) { // the ear has been quicker
            baseFrame_ = index;
            baseTime_ = loop_.now();
        }
    }
    setWritableTimer();
}

void SimulatedOutput::takeBack(std::int64_t index) {
    while (!sounds_.empty() && sounds_.back().first >= index)
        sounds_.pop_back();
    if (!sounds_.empty() && sounds_.back().end > index) {
        Sound& last = sounds_.back();
        last.finish = last.positionAt(index);
        last.end = index;
    }
    writeIndex_ = index;
}

void SimulatedOutput::reset() {
    {
        std::lock_guard lock(mutex_);
        settleHeard();
        takeBack(heard());
    }
    resetReport_ = loop_.at(loop_.now(), [this] { listener_.outputWasReset(); }); // as late as can be
}

void SimulatedOutput::setWritableTimer() {
    std::chrono::nanoseconds time{0};
    {
        std::lock_guard lock(mutex_);
        if (!running_ || writeIndex_ - heard() <= capacity / 2)
            return;
        time = timeOf(writeIndex_ - capacity / 2);
    }
    writableTimer_ = loop_.at(time, [this] { listener_.outputIsWritable(); });
}

} // namespace tarn
