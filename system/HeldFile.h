#pragma once

#include <cstdint>
#include <memory>

#include "system/FileDescriptor.h"

namespace tarn {

/// How a process holds a file for others.
enum class FileForm : std::uint32_t {
    none,
    open,   ///< a descriptor to read it with
    parked, ///< the receiving end of a socket in which the open file is in flight
    path,   ///< a descriptor that only names it (O_PATH)
};

/// A file that the service holds and never reads. Letting it go takes no time whatever its file system does:
/// one that may not answer is held parked or as a path, and nothing hangs when those are closed.
struct HeldFile {
    FileForm form = FileForm::none;
    FileDescriptor descriptor;
};

using SharedFile = std::shared_ptr<const HeldFile>;

} // namespace tarn
