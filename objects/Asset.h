#pragma once

#include <memory>
#include <optional>
#include <string>

#include "roles/MediaAsset.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// Record of an asset of the client: the opened file and what is shown about it.
///
/// Never changes once it is in the registry, so that any thread may read it; an update puts a changed copy in
/// its place.
struct VLTorviAudioFilePlayerAsset {
    std::shared_ptr<MediaAsset> asset; ///< never null, and no other record's
    std::optional<std::string> title;
    std::optional<std::string> albumTitle;
    std::optional<std::string> artist;
    LiveObject<"asset record"> live;

    const void* mediaObject() const { return asset.get(); }
};

} // namespace tarn
