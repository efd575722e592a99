#pragma once

#include <cstdint>
#include <string>

#include "roles/Error.h"

namespace tarn {

/// Domain of the errors of opening and playing files.
inline constexpr char mediaErrorDomain[] = "ostrel.tarnd.media";

enum class MediaErrorCode : std::int64_t {
    unsupportedURL = 1, ///< not a file: URL of this machine
    cannotOpen = 2,     ///< missing, or no right to read it
    notRegularFile = 3, ///< a folder, a device, a FIFO
    notAudio = 4,       ///< nothing in it that can be played
    damaged = 5,        ///< began as audio and cannot be decoded any further
    truncated = 6,      ///< ends before the end that it promised
    cannotRead = 7,     ///< the disk or the file system reports an error
    timedOut = 8,       ///< did not answer in time
    noDecoder = 9,      ///< the decoder module is not installed
};

/// `reason` is for people too; empty when there is nothing to add.
inline Error mediaError(MediaErrorCode code, std::string description, std::string reason = {}) {
    Error error{mediaErrorDomain, static_cast<std::int64_t>(code), {}};
    error.userInfo[localizedDescriptionKey] = std::move(description);
    if (!reason.empty())
        error.userInfo[localizedFailureReasonKey] = std::move(reason);
    return error;
}

} // namespace tarn
