#pragma once

#include <string>
#include <vector>

#include "roles/MediaMetadataItem.h"
#include "roles/MediaTime.h"

namespace tarn {

/// An audio file that was opened: what it says about itself. Identity matters, not equality.
///
/// Everything is read when the asset is made and never changes; any thread may read it. The file stays open
/// as long as the asset lives, so that its removal, its renaming or the loss of the right to open it do not
/// matter.
class MediaAsset {
public:
    virtual ~MediaAsset() = default;

    /// As openAsset() was given it; names the file where nothing better does.
    virtual const std::string& URL() const = 0;

    virtual const std::vector<MediaMetadataItem>& commonMetadata() const = 0;

    /// Exact; not numeric when the file does not tell.
    virtual MediaTime duration() const = 0;
};

} // namespace tarn
