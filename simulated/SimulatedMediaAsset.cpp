#include "simulated/SimulatedMediaAsset.h"

#include <utility>

#include "player/MediaTimes.h"

namespace tarn {

SimulatedMediaAsset::SimulatedMediaAsset(std::string URL, std::shared_ptr<const MediaScript> script)
    : URL_(std::move(URL)), script_(std::move(script)) {
    metadata_.reserve(script_->firstTags.size() + 3);
    metadata_ = script_->firstTags;
    auto add = [this](std::string_view key, const std::optional<std::string>& text) {
        if (text)
            metadata_.emplace_back(key, MediaMetadataItem::commonKeySpace, text);
    };
    add(MediaMetadataItem::commonKeyTitle, script_->title);
    add(MediaMetadataItem::commonKeyAlbumName, script_->albumTitle);
    add(MediaMetadataItem::commonKeyArtist, script_->artist);
}

MediaTime SimulatedMediaAsset::duration() const {
    return script_->tellsDuration ? mediaTimeOf(script_->duration) : MediaTime();
}

} // namespace tarn
