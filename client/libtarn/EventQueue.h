#pragma once

#include <chrono>
#include <condition_variable>
#include <deque>
#include <iterator>
#include <mutex>
#include <optional>
#include <vector>

#include <tarn/Event.h>

namespace tarn {

/// The events that a program has not asked for yet. Any thread may call.
class EventQueue {
public:
    static constexpr std::size_t mostEvents = 4'096;

    /// The oldest gives way when there are too many.
    void push(client::Event event) {
        std::lock_guard lock(mutex_);
        ended_ = std::holds_alternative<client::ConnectionLost>(event) ||
                 std::holds_alternative<client::TakenOver>(event);
        if (events_.size() == mostEvents)
            events_.pop_front();
        events_.push_back(std::move(event));
        changed_.notify_all(); // it may be the last one
    }

    /// None when the time came first, or when the last event was one that nothing follows.
    std::optional<client::Event> pop(std::optional<std::chrono::steady_clock::time_point> until) {
        std::unique_lock lock(mutex_);
        const auto ready = [&] { return !events_.empty() || ended_; };
        if (until)
            changed_.wait_until(lock, *until, ready);
        else
            changed_.wait(lock, ready);
        if (events_.empty())
            return std::nullopt;
        client::Event event = std::move(events_.front());
        events_.pop_front();
        return event;
    }

    std::vector<client::Event> popAll() {
        std::lock_guard lock(mutex_);
        std::vector<client::Event> all(std::make_move_iterator(events_.begin()),
                                       std::make_move_iterator(events_.end()));
        events_.clear();
        return all;
    }

    /// Would pop() return at once?
    bool isReady() {
        std::lock_guard lock(mutex_);
        return !events_.empty() || ended_;
    }

    /// For a new connection: more events come.
    void begin() {
        std::lock_guard lock(mutex_);
        ended_ = false;
    }

    /// There is no connection after all: whoever waits gets none.
    void end() {
        std::lock_guard lock(mutex_);
        ended_ = true;
        changed_.notify_all();
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<client::Event> events_;
    bool ended_ = false;
};

} // namespace tarn
