#pragma once

#include <memory>
#include <string>
#include <vector>

#include "roles/MediaAsset.h"
#include "simulated/MediaScript.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// An asset as its script has it.
class SimulatedMediaAsset final : public MediaAsset {
public:
    SimulatedMediaAsset(std::string URL, std::shared_ptr<const MediaScript> script);

    const std::vector<MediaMetadataItem>& commonMetadata() const override { return metadata_; }
    MediaTime duration() const override;

    const std::string& URL() const override { return URL_; }
    const MediaScript& script() const { return *script_; }

private:
    const std::string URL_;
    const std::shared_ptr<const MediaScript> script_;
    std::vector<MediaMetadataItem> metadata_;
    LiveObject<"media asset"> live_;
};

} // namespace tarn
