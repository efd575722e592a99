#pragma once

#include <chrono>
#include <vector>

#include "media/MediaProcess.h"

namespace tarn {

/// Children of one kind that do one thing after the other, each for one caller at a time. Any thread may
/// call.
///
/// When one of them hangs in a file system the others go on, and it is left to itself until it says that it
/// is done, or ended after a while.
class ChildPool {
public:
    ChildPool(MediaProcess& process, ChildKind kind) : process_(process), kind_(kind) {}

    /// One that has nothing to do, or a new one; none when there can be none.
    std::optional<MediaChild> take();

    /// Gives it back. `idle`: its answer was the last of it; otherwise it says when it is done.
    void put(MediaChild child, bool idle);

    /// Lets all go that are not in use.
    void clear();

private:
    using Time = std::chrono::steady_clock::time_point;

    struct Held {
        MediaChild child;
        bool idle;
        Time since;
    };

    static bool isFree(Held& held);

    MediaProcess& process_;
    const ChildKind kind_;
    MutexProtected<std::vector<Held>> held_;
};

} // namespace tarn
