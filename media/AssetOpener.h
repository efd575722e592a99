#pragma once

#include "media/DecoderLoader.h"
#include "roles/MediaEngine.h"
#include "system/FileAccess.h"

namespace tarn {

/// Makes assets from URLs: regular files of this machine only, with the right to the file that a client
/// handed over or else the service's own. Any thread may call.
class AssetOpener {
public:
    /// Both outlive the opener.
    AssetOpener(FileAccess& access, DecoderLoader& loader) : access_(access), loader_(loader) {}

    /// Takes ten seconds at most.
    MediaAssetOutcome open(const std::string& URL) const;

private:
    FileAccess& access_;
    DecoderLoader& loader_;
};

} // namespace tarn
