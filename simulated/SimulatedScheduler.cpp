#include "simulated/SimulatedScheduler.h"

#include <algorithm>
#include <cassert>
#include <cstdio>
#include <cstdlib>
#include <utility>

#include "simulated/SimulatedActivity.h"
#include "simulated/SimulatedQueue.h"

namespace tarn {

namespace {

/// Takes out the element at `index`; the order of the rest is free.
template <class T>
T takeAt(std::vector<T>& list, std::size_t index) {
    std::swap(list[index], list.back());
    T taken = std::move(list.back());
    list.pop_back();
    return taken;
}

/// A lane that `activity` waits for is held by one that waits, maybe over others, for `activity` itself.
bool waitsInACircle(const SimulatedActivity& activity) {
    const SimulatedActivity* holder = activity.waitsFor->holder;
    while (holder != nullptr && holder != &activity)
        holder = holder->waitsFor == nullptr ? nullptr : holder->waitsFor->holder;
    return holder != nullptr;
}

[[noreturn]] void reportCircle(const SimulatedActivity& activity) {
    std::fprintf(stderr, "deadlock:\n");
    const SimulatedActivity* waiting = &activity;
    do {
        for (const auto* lane : waiting->inside)
            std::fprintf(stderr, "  work of \"%s\"\n", lane->label.c_str());
        std::fprintf(stderr, "  waits for \"%s\"\n", waiting->waitsFor->label.c_str());
        waiting = waiting->waitsFor->holder;
    } while (waiting != &activity);
    std::abort();
}

using TimedWork = std::function<void()>;

/// Keeps a timer going, and its work wanted.
struct TimerRegistration final : Registration {
    TimerRegistration(std::shared_ptr<TimedWork> timerToKeep, std::shared_ptr<TimedWork> workToKeep)
        : timer(std::move(timerToKeep)), work(std::move(workToKeep)) {}

    const std::shared_ptr<TimedWork> timer;
    const std::shared_ptr<TimedWork> work;
};

} // namespace

SimulatedScheduler::SimulatedScheduler(std::uint64_t seed) : engine_(seed) {
    activities_.push_back(std::make_unique<SimulatedActivity>());
    current_ = activities_.front().get();
}

SimulatedScheduler::~SimulatedScheduler() { runUntilIdle(); }

std::shared_ptr<SimulatedQueue> SimulatedScheduler::createQueue(std::string label) {
    return std::make_shared<SimulatedQueue>(*this, std::move(label));
}

RegistrationHandle SimulatedScheduler::at(Time time, const std::shared_ptr<SimulatedQueue>& queue,
                                          std::function<void()> work) {
    auto wanted = std::make_shared<TimedWork>(std::move(work));
    auto timer = addTimer(time, [this, lane = queue->lane_, weak = std::weak_ptr(wanted)] {
        submit(lane, [weak] {
            if (auto stillWanted = weak.lock())
                (*stillWanted)();
        });
    });
    return std::make_unique<TimerRegistration>(std::move(timer), std::move(wanted));
}

std::size_t SimulatedScheduler::random(std::size_t limit) {
    return static_cast<std::size_t>(engine_() % limit);
}

void SimulatedScheduler::yieldPoint() {
    if (current_ == activities_.front().get() || random(yieldOneIn) != 0)
        return;
    ready_.push_back(current_);
    leave();
}

void SimulatedScheduler::runUntil(Time limit) {
    assert(current_ == activities_.front().get());
    limit_ = limit;
    testIdles_ = true;
    leave();
    testIdles_ = false;
}

SimulatedScheduler::Choice SimulatedScheduler::choose() {
    for (;;) {
        if (std::size_t candidates = ready_.size() + runnable_.size()) {
            std::size_t index = random(candidates);
            if (index < ready_.size())
                return {nullptr, takeAt(ready_, index)};
            return {takeAt(runnable_, index - ready_.size()), nullptr};
        }
        if (!moveTime()) {
            assert(testIdles_); // the circles are all that could keep the test from going on
            return {nullptr, activities_.front().get()};
        }
    }
}

/// To the next timer, and all that are due then; false when there is none within the limit.
bool SimulatedScheduler::moveTime() {
    Time limit = testIdles_ ? limit_ : Time::max();
    std::erase_if(timers_, [](const auto& timer) { return timer.second.expired(); });
    if (timers_.empty() || timers_.begin()->first > limit) {
        if (limit != Time::max())
            now_ = limit;
        return false;
    }
    now_ = std::max(now_, timers_.begin()->first);
    while (!timers_.empty() && timers_.begin()->first <= now_) {
        auto timer = timers_.begin()->second.lock();
        timers_.erase(timers_.begin());
        if (timer != nullptr)
            (*timer)();
    }
    return true;
}

/// Goes on with other work; returns when the current activity is chosen again.
void SimulatedScheduler::leave() {
    SimulatedActivity& self = *current_;
    Choice next = choose();
    if (next.activity == &self)
        return;
    if (next.activity == nullptr) {
        next.activity = &spareActivity();
        next.activity->first = std::move(next.lane);
    }
    current_ = next.activity;
    self.switchTo(*next.activity);
}

void SimulatedScheduler::wake(SimulatedActivity& activity) { ready_.push_back(&activity); }

SimulatedActivity& SimulatedScheduler::spareActivity() {
    if (!spare_.empty())
        return *takeAt(spare_, spare_.size() - 1);
    activities_.push_back(std::make_unique<SimulatedActivity>(*this));
    return *activities_.back();
}

std::shared_ptr<SimulatedScheduler::Timer> SimulatedScheduler::addTimer(Time time, Timer fire) {
    auto timer = std::make_shared<Timer>(std::move(fire));
    timers_.emplace(time, timer);
    return timer;
}

void SimulatedScheduler::submit(const Lane& lane, Work work) {
    if (lane->holder == nullptr && lane->line.empty())
        runnable_.push_back(lane);
    lane->line.push_back({std::move(work), nullptr});
}

void SimulatedScheduler::takeTurn(const Lane& lane) {
    SimulatedActivity& self = *current_;
    if (lane->holder == nullptr && lane->line.empty()) {
        lane->holder = &self;
        return;
    }
    lane->line.push_back({nullptr, &self});
    self.waitsFor = lane.get();
    if (waitsInACircle(self))
        reportCircle(self);
    leave();
}

void SimulatedScheduler::giveUp(const Lane& lane) {
    lane->holder = nullptr;
    if (lane->line.empty())
        return;
    if (SimulatedActivity* turn = lane->line.front().turn) { // granted at once: the order is kept
        lane->line.pop_front();
        lane->holder = turn;
        turn->waitsFor = nullptr;
        wake(*turn);
    } else {
        runnable_.push_back(lane);
    }
}

/// Runs the first work of a lane that was chosen.
void SimulatedScheduler::runFirst(const Lane& lane) {
    auto work = std::move(lane->line.front().work);
    lane->line.pop_front();
    lane->holder = current_;
    runInside(lane, work);
    current_->inside.push_back(lane.get());
    work = nullptr;
    current_->inside.pop_back();
    giveUp(lane);
}

} // namespace tarn
