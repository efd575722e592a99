#pragma once

#include <functional>
#include <memory>

#include "player/EventLoop.h"
#include "roles/MediaAsset.h"

namespace tarn {

/// Knows whether there are assets, and so a use for the processes that touch media, and calls a moment after
/// the last one has gone: the rest of a client goes, or the next one comes. Any thread may call.
class MediaUse {
public:
    /// `unused` is called on the loop, which outlives this; assets need not be outlived.
    MediaUse(EventLoop& loop, std::function<void()> unused);

    /// Nothing is called any more.
    ~MediaUse();

    /// The asset itself, counted as long as it lives.
    std::shared_ptr<MediaAsset> counted(std::shared_ptr<MediaAsset> asset);

private:
    class Count;
    const std::shared_ptr<Count> count_;
};

} // namespace tarn
