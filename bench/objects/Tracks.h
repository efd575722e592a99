#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "objects/AssetManager.h"
#include "objects/PlayerItemManager.h"
#include "simulated/SimulatedPlatform.h"
#include "threads/MutexProtected.h"

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

    /// The same keys in maps of the standard library, each under a lock as any thread may ask, as far apart
    /// in memory as the tracks are.
    struct BareMaps {
        MutexProtected<std::unordered_map<std::string, std::shared_ptr<int>>> objectOfName;
        MutexProtected<std::unordered_map<const void*, std::shared_ptr<int>>> objectOfAddress;
        MutexProtected<std::unordered_map<const void*, std::string>> nameOfAddress;
        std::vector<std::unique_ptr<char[]>> distance; // between their entries
    };
    const BareMaps& bareMaps() const { return bareMaps_; }

    /// What the managers and all that they keep take of the heap, for each track.
    double bytesPerTrack() const { return bytesPerTrack_; }

private:
    class Sink;

    void mirror(const std::string& name);
    void addToBareMaps(std::size_t track);

    SimulatedPlatform device_{1};
    std::shared_ptr<Sink> sink_;
    std::shared_ptr<VLTorviAudioFilePlayerAssetManager> assets_;
    std::shared_ptr<VLTorviAudioFilePlayerItemManager> items_;
    std::vector<std::optional<std::string>> names_;
    std::vector<const MediaAsset*> assetObjects_;
    std::vector<const MediaItem*> itemObjects_;
    BareMaps bareMaps_;
    double bytesPerTrack_ = 0;
};

} // namespace tarn
