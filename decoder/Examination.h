#pragma once

#include <optional>

#include "decoder/ByteSource.h"
#include "mediaprotocol/AudioFileInfo.h"
#include "roles/Error.h"

namespace tarn {

/// What a file says about itself, or why it is not to be played.
struct ExaminedFile {
    std::optional<AudioFileInfo> info;
    Error error; ///< meaningful when there is no info
};

/// Reads format, tags and exact length.
ExaminedFile examineFile(ByteSource& source);

} // namespace tarn
