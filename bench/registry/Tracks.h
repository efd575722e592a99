#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "assets/AssetManager.h"
#include "assets/PlayerItemManager.h"
#include "platform/simulated/SimulatedPlatform.h"

namespace tarn {

/// A client's library as the service mirrors it: for each track an asset with its tags and a player item that
/// reports, with identifiers and file names as long as real ones.
class Tracks {
public:
    explicit Tracks(std::size_t count);

    std::size_t count() const { return names_.size(); }
    const std::optional<std::string>& name(std::size_t track) const { return names_[track]; }
    const MediaAsset* asset(std::size_t track) const { return assetObjects_[track]; }
    const MediaItem* item(std::size_t track) const { return itemObjects_[track]; }

    const VLTorviAudioFilePlayerAssetManager& assets() const { return *assets_; }
    const VLTorviAudioFilePlayerItemManager& items() const { return *items_; }

    /// What the managers and all that they keep take of the heap, for each track.
    double bytesPerTrack() const { return bytesPerTrack_; }

private:
    class Sink;

    void mirror(const std::string& name);

    SimulatedPlatform device_{1};
    std::shared_ptr<Sink> sink_;
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assets_;
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> items_;
    std::vector<std::optional<std::string>> names_;
    std::vector<const MediaAsset*> assetObjects_;
    std::vector<const MediaItem*> itemObjects_;
    double bytesPerTrack_ = 0;
};

} // namespace tarn
