#pragma once

#include "mediaprotocol/AudioFileInfo.h"
#include "roles/MediaAsset.h"
#include "system/HeldFile.h"

namespace tarn {

/// An audio file that the service holds without reading it, with what an examiner has read from it.
class LinuxMediaAsset final : public MediaAsset {
public:
    LinuxMediaAsset(std::string URL, SharedFile file, AudioFileInfo info);

    const std::string& URL() const override { return URL_; }
    const std::vector<MediaMetadataItem>& commonMetadata() const override { return metadata_; }
    MediaTime duration() const override;

    const HeldFile& file() const { return *file_; }

    /// Without its tags: they are in commonMetadata().
    const AudioFileInfo& info() const { return info_; }

private:
    const std::string URL_;
    const SharedFile file_;
    AudioFileInfo info_;
    std::vector<MediaMetadataItem> metadata_;
};

} // namespace tarn
