#include "platform/linux/media/AssetOpener.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>

#include "platform/linux/media/FileURL.h"
#include "platform/linux/media/LinuxMediaAsset.h"
#include "platform/linux/media/MediaError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto openingLimit = 10s;

MediaAssetOutcome failed(MediaErrorCode code, std::string description, std::string reason = {}) {
    return {nullptr, mediaError(code, std::move(description), std::move(reason))};
}

struct OpenedFile {
    SharedFile file;
    int error = 0;
    bool regular = false;
};

// A FIFO or a device must not hold us up, nor a terminal become ours.
OpenedFile openByPath(const std::string& path) {
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
    if (!file)
        return {nullptr, errno, false};
    struct stat status {};
    const bool regular = fstat(file.get(), &status) == 0 && S_ISREG(status.st_mode);
    return {std::make_shared<const FileDescriptor>(std::move(file)), 0, regular};
}

} // namespace

MediaAssetOutcome AssetOpener::open(const std::string& URL) const {
    const SteadyTime deadline = std::chrono::steady_clock::now() + openingLimit;
    const auto path = pathFromFileURL(URL);
    if (!path)
        return failed(MediaErrorCode::unsupportedURL, "Only files of this device can be played.");

    auto opened = std::make_shared<OpenedFile>();
    if (FileDescriptor handed = access_.open(*path))
        *opened = {std::make_shared<const FileDescriptor>(std::move(handed)), 0, true};
    else if (!callUntil(deadline, [opened, path = *path] { *opened = openByPath(path); }))
        return failed(MediaErrorCode::timedOut, "The file did not answer in time.");
    if (!opened->file)
        return failed(MediaErrorCode::cannotOpen, "The file could not be opened.",
                      std::strerror(opened->error));
    if (!opened->regular)
        return failed(MediaErrorCode::notRegularFile, "That is not a regular file.");

    const DecoderModule* decoder = loader_.load();
    if (decoder == nullptr)
        return failed(MediaErrorCode::noDecoder, "The audio decoder is not installed.");
    FileReader reader(opened->file, openingLimit, deadline);
    DecoderModule::Examined examined = decoder->examine(reader);
    if (!examined.info)
        return {nullptr, std::move(examined.error)};
    return {std::make_shared<LinuxMediaAsset>(URL, opened->file, *std::move(examined.info)), {}};
}

} // namespace tarn
