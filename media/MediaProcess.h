#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>

#include "media/MediaChild.h"
#include "mediaprotocol/RingMemory.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The way to processes that touch media: they are forks of a parent that is started when the first is
/// wanted. Any thread may call.
class MediaProcess {
public:
    /// A new child; none when the parent cannot be started. It need not be there yet: what is sent to it
    /// waits for it. A renderer gets its ring.
    std::optional<MediaChild> fork(ChildKind kind, const RingMemory* ring = nullptr);

    /// Something went wrong with a child: the next ones come from a new parent. The children that there are
    /// go on.
    void renew();

    /// A child has told what holds it: that is said once in the log.
    void noteLocks(std::uint32_t locks);

private:
    struct State {
        std::shared_ptr<MediaParent> parent; // null before it is needed
        std::uint64_t lastId = 0;
    };

    MutexProtected<State> state_;
    std::atomic<bool> locksNoted_ = false;
};

} // namespace tarn
