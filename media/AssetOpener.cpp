#include "media/AssetOpener.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>

#include "media/FileReader.h"
#include "media/FileURL.h"
#include "media/LinuxMediaAsset.h"
#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto openingLimit = 10s;

MediaAssetOutcome failed(MediaErrorCode code, std::string description, std::string reason = {}) {
    return {nullptr, mediaError(code, std::move(description), std::move(reason))};
}

MediaAssetOutcome late() { return failed(MediaErrorCode::timedOut, "The file did not answer in time."); }

/// What is found out where a file system may keep us waiting; shared with the thread that waits.
struct Opening {
    SharedFile file;
    int error = 0;
    DecoderModule::Examined examined;
};

// A FIFO or a device must not hold us up, nor a terminal become ours.
FileDescriptor openByPath(const std::string& path) {
    return FileDescriptor(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
}

void openFile(Opening& opening, FileDescriptor handed, const std::string& path) {
    FileDescriptor file = handed ? std::move(handed) : openByPath(path);
    if (file)
        opening.file = std::make_shared<const MediaFile>(std::move(file));
    else
        opening.error = errno;
}

bool examine(const std::shared_ptr<Opening>& opening, const DecoderModule& decoder, SteadyTime deadline) {
    const auto work = [opening, &decoder, deadline] {
        FileReader reader(opening->file, deadline);
        opening->examined = decoder.examine(reader);
    };
    if (opening->file->remote)
        return callUntil(deadline, work);
    work();
    return true;
}

} // namespace

MediaAssetOutcome AssetOpener::open(const std::string& URL) const {
    const SteadyTime deadline = std::chrono::steady_clock::now() + openingLimit;
    const auto path = pathFromFileURL(URL);
    if (!path)
        return failed(MediaErrorCode::unsupportedURL, "Only files of this device can be played.");

    const auto opening = std::make_shared<Opening>();
    const auto handed = std::make_shared<FileDescriptor>(access_.open(*path));
    if (!callUntil(deadline,
                   [opening, handed, path = *path] { openFile(*opening, std::move(*handed), path); }))
        return late();
    if (!opening->file)
        return failed(MediaErrorCode::cannotOpen, "The file could not be opened.",
                      std::strerror(opening->error));
    if (!opening->file->regular)
        return failed(MediaErrorCode::notRegularFile, "That is not a regular file.");

    const DecoderModule* decoder = loader_.load();
    if (decoder == nullptr)
        return failed(MediaErrorCode::noDecoder, "The audio decoder is not installed.");
    if (!examine(opening, *decoder, deadline))
        return late();
    DecoderModule::Examined& examined = opening->examined;
    if (!examined.info)
        return {nullptr, std::move(examined.error)};
    return {std::make_shared<LinuxMediaAsset>(URL, opening->file, *std::move(examined.info)), {}};
}

} // namespace tarn
