#pragma once

#include <cstdint>
#include <memory>

#include "roles/MediaTime.h"
#include "roles/RateThreshold.h"

namespace tarn {

class MediaItem;

/// What a queue player does at one moment: everything in it was true at the same time.
struct PlaybackState {
    float rate = 0;                  ///< 0 while it is paused, below 0 while it plays backwards
    bool isHeld = false;             ///< the sound server lets nothing of it be heard, whatever the rate is
    std::shared_ptr<MediaItem> item; ///< the current one; none when the queue is empty
    MediaTime position = MediaTime::zero(); ///< of that item: what is heard of it while it plays
    bool hasNextItem = false;
    std::uint64_t seeks = 0; ///< how often the position of a current item was set so far

    /// Is something of it heard, or about to be?
    bool plays() const { return item != nullptr && !isZeroRate(rate) && !isHeld; }
};

} // namespace tarn
