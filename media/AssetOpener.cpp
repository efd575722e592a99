#include "media/AssetOpener.h"

#include "media/FileURL.h"
#include "media/LinuxMediaAsset.h"
#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto openingLimit = 10s;

} // namespace

MediaAssetOutcome AssetOpener::open(const std::string& URL) const {
    const auto deadline = std::chrono::steady_clock::now() + openingLimit;
    const auto path = pathFromFileURL(URL);
    if (!path)
        return {nullptr,
                mediaError(MediaErrorCode::unsupportedURL, "Only files of this device can be played.")};
    FilePorter::Opened opened{access_.open(*path), {}};
    if (!opened.file)
        opened = porter_.open(*path, deadline);
    if (!opened.file)
        return {nullptr, std::move(opened.error)};
    FileExaminer::Outcome examined = examiner_.examine(*opened.file, deadline);
    if (!examined.info)
        return {nullptr, std::move(examined.error)};
    return {std::make_shared<LinuxMediaAsset>(URL, std::move(opened.file), *std::move(examined.info)), {}};
}

} // namespace tarn
