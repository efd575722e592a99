#include "media/MediaProcess.h"

#include <vector>

#include "log/SystemLog.h"

namespace tarn {

std::optional<MediaChild> MediaProcess::fork(ChildKind kind, const RingMemory* ring) {
    auto ends = Channel::makePair();
    if (!ends)
        return std::nullopt;
    std::vector<int> files{ends->second.socket()};
    if (ring != nullptr)
        files.push_back(ring->descriptor());
    std::shared_ptr<MediaParent> old; // ends behind the lock
    return state_.withLocked([&](State& state) -> std::optional<MediaChild> {
        if (state.parent && !state.parent->isGood())
            old.swap(state.parent);
        if (!state.parent)
            state.parent = MediaParent::start();
        const std::uint64_t id = ++state.lastId;
        if (!state.parent || !state.parent->fork(kind, id, files))
            return std::nullopt;
        return MediaChild(std::move(ends->first), state.parent, id);
    });
}

void MediaProcess::renew() {
    auto old = state_.withLocked([](State& state) { return std::move(state.parent); });
}

void MediaProcess::noteLocks(std::uint32_t locks) {
    if (locksNoted_.exchange(true))
        return;
    SystemLog::message(__func__, __LINE__, "%{public}s:%d: What decodes media is locked down: %{public}s",
                       lockDownText(locks));
}

} // namespace tarn
