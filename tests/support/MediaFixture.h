#pragma once

#include <gtest/gtest.h>

#include <memory>

#include "media/AssetOpener.h"
#include "media/LinuxMediaAsset.h"
#include "mediaprotocol/MediaError.h"
#include "tests/support/AudioFixture.h"
#include "tests/support/Samples.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// No client has handed a file over.
class NoFileAccess final : public FileAccess {
public:
    SharedFile open(const std::string&) override { return nullptr; }
};

/// The service's way to files.
struct FilesOfTheService {
    MediaAssetOutcome openURL(const std::string& URL) {
        return AssetOpener(access, porter, examiner).open(URL);
    }

    std::shared_ptr<LinuxMediaAsset> openFile(const std::filesystem::path& path) {
        MediaAssetOutcome outcome = openURL(fileURL(path));
        EXPECT_NE(outcome.asset, nullptr) << path << ": " << outcome.error.userInfo[localizedDescriptionKey]
                                          << " " << outcome.error.userInfo[localizedFailureReasonKey];
        return std::static_pointer_cast<LinuxMediaAsset>(outcome.asset);
    }

    MediaProcess process;
    FilePorter porter{process};
    FileExaminer examiner{process, porter};
    NoFileAccess access;
};

} // namespace tarn
