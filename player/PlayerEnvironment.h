#pragma once

#include <functional>
#include <mutex>
#include <utility>
#include <vector>

namespace tarn {

class NotificationCenter;
class OutputFactory;
class EventLoop;
class RenderingFactory;

/// What the players and items of one engine share. Outlives all of them.
struct PlayerEnvironment {
    EventLoop& loop;
    RenderingFactory& renderings;
    OutputFactory& outputs;
    NotificationCenter& notifications;

    /// Guards the state of every item and player of the engine, so that an item that passes from one player
    /// to another has one truth. Nothing is called out to under it but Output.
    std::mutex mutex{};

    /// What is to be done as soon as the mutex has been let go.
    std::vector<std::function<void()>> afterwards{};
};

/// Holds the environment's mutex, and does afterwards what has been put off meanwhile.
class EngineLock final {
public:
    explicit EngineLock(PlayerEnvironment& environment)
        : environment_(environment), lock_(environment.mutex) {}

    ~EngineLock() {
        auto afterwards = std::exchange(environment_.afterwards, {});
        lock_.unlock();
        for (const auto& work : afterwards)
            work();
    }

    EngineLock(const EngineLock&) = delete;
    EngineLock& operator=(const EngineLock&) = delete;

private:
    PlayerEnvironment& environment_;
    std::unique_lock<std::mutex> lock_;
};

} // namespace tarn
