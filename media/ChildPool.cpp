#include "media/ChildPool.h"

#include <iterator>

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr auto longestIdle = 8s; // it ends by itself a little later
constexpr auto longestBusy = 10s;

} // namespace

/// Is it alive, with nothing to do?
bool ChildPool::isFree(Held& held) {
    ReceivedMessage message;
    const Channel::Result result = held.child.channel().receiveNow(message);
    if (held.idle)
        return result == Channel::Result::notNow; // it says nothing, and has not ended
    held.idle = result == Channel::Result::done && message.as<ChildIsIdle>().has_value();
    return held.idle;
}

std::optional<MediaChild> ChildPool::take() {
    std::vector<Held> dropped; // end behind the lock
    auto child = held_.withLocked([&](std::vector<Held>& all) {
        const Time now = std::chrono::steady_clock::now();
        std::optional<MediaChild> found;
        for (auto held = all.begin(); held != all.end();) {
            const auto age = now - held->since;
            const bool usable = age < longestIdle && isFree(*held);
            const bool waits = !usable && !held->idle && age < longestBusy;
            if (waits || (usable && found)) {
                ++held;
                continue;
            }
            if (usable)
                found = std::move(held->child);
            else
                dropped.push_back(std::move(*held));
            held = all.erase(held);
        }
        return found;
    });
    return child ? std::move(child) : process_.fork(kind_);
}

void ChildPool::put(MediaChild child, bool idle) {
    held_.withLocked([&](std::vector<Held>& all) {
        all.push_back({std::move(child), idle, std::chrono::steady_clock::now()});
    });
}

void ChildPool::clear() {
    auto dropped = held_.withLocked([](std::vector<Held>& all) { return std::exchange(all, {}); });
}

} // namespace tarn
