#pragma once

#include <memory>
#include <string>
#include <vector>

#include "roles/Error.h"
#include "roles/MediaAsset.h"
#include "roles/MediaItem.h"
#include "roles/MediaQueuePlayer.h"

namespace tarn {

/// An asset, or why there is none.
struct MediaAssetOutcome {
    std::shared_ptr<MediaAsset> asset;
    Error error; // meaningful when there is no asset
};

/// Makes the media objects. Any thread may call.
class MediaEngine {
public:
    virtual ~MediaEngine() = default;

    /// Opens the file and reads its tags and duration; may block for up to ten seconds on a file that does
    /// not answer. Only `file:` URLs of regular files that hold audio open.
    virtual MediaAssetOutcome openAsset(const std::string& URL) = 0;

    virtual std::shared_ptr<MediaItem> makeItem(std::shared_ptr<MediaAsset> asset) = 0;

    /// A player of these items in this order, paused.
    virtual std::shared_ptr<MediaQueuePlayer>
    makeQueuePlayer(std::vector<std::shared_ptr<MediaItem>> items) = 0;
};

} // namespace tarn
