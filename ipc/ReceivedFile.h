#pragma once

#include <utility>

#include "system/FileDescriptor.h"

namespace tarn {

/// An open file that another process sent. Any thread may let it go and is not held up: closing may take as
/// long as the sender likes, such as for a socket that lingers or a file whose file system stands still. One
/// thread of its own closes all of them; it lasts while there are any.
class ReceivedFile {
public:
    ReceivedFile() = default;
    explicit ReceivedFile(FileDescriptor file) : file_(std::move(file)) {}
    ~ReceivedFile();
    ReceivedFile(ReceivedFile&&) noexcept = default;
    ReceivedFile& operator=(ReceivedFile&& other) noexcept {
        std::swap(file_, other.file_);
        return *this;
    }

    /// -1 when there is none.
    int get() const { return file_.get(); }
    explicit operator bool() const { return static_cast<bool>(file_); }

private:
    FileDescriptor file_;
};

} // namespace tarn
