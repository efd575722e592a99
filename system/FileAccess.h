#pragma once

#include <string>

#include "system/HeldFile.h"

namespace tarn {

/// The files that clients have handed over open. Any thread may call.
class FileAccess {
public:
    virtual ~FileAccess() = default;

    /// The file that is held for exactly this path while a consumed token has not been released; null when
    /// there is none, and then the service's own rights decide.
    ///
    /// A regular file, readable. It shares its offset with the client: it is to be read with pread().
    virtual SharedFile open(const std::string& path) = 0;
};

} // namespace tarn
