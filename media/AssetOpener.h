#pragma once

#include <memory>

#include "media/FileExaminer.h"
#include "roles/MediaEngine.h"
#include "system/FileAccess.h"

namespace tarn {

/// Makes assets from URLs: regular files of this machine only, with the right to the file that a client
/// handed over or else the service's own. Any thread may call.
class AssetOpener {
public:
    /// All outlive the opener.
    AssetOpener(FileAccess& access, FilePorter& porter, FileExaminer& examiner)
        : access_(access), porter_(porter), examiner_(examiner) {}

    /// Takes ten seconds at most.
    MediaAssetOutcome open(const std::string& URL) const;

private:
    FileAccess& access_;
    FilePorter& porter_;
    FileExaminer& examiner_;
};

} // namespace tarn
