#include "media/LinuxMediaAsset.h"

#include <utility>

namespace tarn {

LinuxMediaAsset::LinuxMediaAsset(std::string URL, SharedFile file, AudioFileInfo info)
    : URL_(std::move(URL)), file_(std::move(file)), info_(std::move(info)) {
    const auto keep = [this](std::string_view key, std::optional<std::string>& text) {
        if (text)
            metadata_.emplace_back(key, MediaMetadataItem::commonKeySpace, std::exchange(text, std::nullopt));
    };
    keep(MediaMetadataItem::commonKeyTitle, info_.title);
    keep(MediaMetadataItem::commonKeyAlbumName, info_.album);
    keep(MediaMetadataItem::commonKeyArtist, info_.artist);
}

MediaTime LinuxMediaAsset::duration() const {
    const auto frames = info_.frames ? info_.frames : info_.estimatedFrames;
    if (!frames)
        return {};
    return {*frames, static_cast<std::int32_t>(info_.format.rate)};
}

} // namespace tarn
