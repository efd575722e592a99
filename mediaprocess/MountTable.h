#pragma once

#include <cstdint>
#include <set>

#include "system/FileDescriptor.h"

namespace tarn {

/// Which file systems answer by themselves, and which have another machine or process answer for them, or
/// not. Asks no file system, as that might be one that does not answer.
class MountTable {
public:
    MountTable();

    /// Is `file`, which may be open as a path only, on a file system of this machine? Those that are not
    /// known do not count as such.
    bool holdsLocally(int file);

private:
    bool changed() const;
    void read();

    const FileDescriptor table_;
    std::set<std::uint64_t> local_; // by the mounts' ids
    bool known_ = false;
};

} // namespace tarn
