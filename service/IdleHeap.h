#pragma once

#include <memory>

#include "player/EventLoop.h"
#include "roles/MediaAsset.h"

namespace tarn {

/// Gives the memory that is free back to the system a moment after the last asset has gone: the allocator
/// keeps it for itself otherwise, all that a client's twenty thousand tracks took. Any thread may call.
class IdleHeap {
public:
    /// `loop`, on which the work is done, outlives the heap; assets need not be outlived.
    explicit IdleHeap(EventLoop& loop);
    ~IdleHeap();

    /// The asset itself, counted as long as it lives.
    std::shared_ptr<MediaAsset> counted(std::shared_ptr<MediaAsset> asset);

private:
    class Count;
    const std::shared_ptr<Count> count_;
};

} // namespace tarn
