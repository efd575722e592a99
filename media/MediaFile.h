#pragma once

#include <cstdint>
#include <memory>

#include "system/FileDescriptor.h"

namespace tarn {

/// An open file, with what the file system told of it then: asking again might take for ever.
struct MediaFile {
    /// Asks the file system.
    explicit MediaFile(FileDescriptor opened);

    FileDescriptor descriptor;
    std::int64_t size = 0;
    bool regular = false;
    bool remote = false; ///< another machine or process answers for it, or does not
};

using SharedFile = std::shared_ptr<const MediaFile>;

} // namespace tarn
