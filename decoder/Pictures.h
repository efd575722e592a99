#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "decoder/ByteSource.h"

namespace tarn {

/// Bytes to read instead of those that stand in the file.
struct Patch {
    std::int64_t offset = 0;
    std::string bytes;
};

/// FFmpeg reads every picture of a file when it opens it, covers of 10 MB too. These patches make those that
/// are larger than `largest` something that it skips: an unknown frame of an ID3 tag, padding in FLAC, free
/// space in MP4. In other formats nothing can be hidden.
std::vector<Patch> hidePictures(ByteSource& source, std::int64_t largest);

/// A picture as it stands in the file.
struct Picture {
    std::vector<std::byte> bytes;
    std::string mimeType; ///< "image/jpeg", "image/png", ...
};

/// The cover that a file carries: the front if it has several. None when it has none, or only such as are
/// larger than 4 MiB or of a kind that is unknown.
std::optional<Picture> readPicture(ByteSource& source);

} // namespace tarn
