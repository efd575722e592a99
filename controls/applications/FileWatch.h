#pragma once

#include <filesystem>

#include "system/FileDescriptor.h"

namespace tarn {

/// Notices changes of files and folders. The kernel takes the notes: nobody is woken up, and asking costs one
/// system call however much is watched.
class FileWatch {
public:
    FileWatch();

    /// Watches a folder and the files in it, or one file; a link stands for what it leads to. What cannot be
    /// watched, such as one too many for the system, is left out.
    void add(const std::filesystem::path& path);

    /// Has anything that is watched changed since it was added, or since this last was true? Even a file that
    /// was written over in place.
    bool sawChange() const;

private:
    FileDescriptor notes_;
};

} // namespace tarn
