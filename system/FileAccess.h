#pragma once

#include <string>

#include "system/FileDescriptor.h"

namespace tarn {

/// The files that clients have handed over open. Any thread may call.
class FileAccess {
public:
    virtual ~FileAccess() = default;

    /// The open file that is held for exactly this path while a consumed token has not been released; none
    /// when there is none, and then the service's own rights decide.
    ///
    /// A regular file, readable, close-on-exec. It shares its offset with the client: read it with pread().
    virtual FileDescriptor open(const std::string& path) = 0;
};

} // namespace tarn
