#pragma once

#include <unistd.h>

#include <utility>

namespace tarn {

/// Owns one open file descriptor and closes it.
class FileDescriptor {
public:
    FileDescriptor() = default;
    explicit FileDescriptor(int number) : number_(number) {}
    FileDescriptor(FileDescriptor&& other) noexcept : number_(other.release()) {}
    FileDescriptor& operator=(FileDescriptor&& other) noexcept {
        reset(other.release());
        return *this;
    }
    ~FileDescriptor() { reset(); }

    /// -1 when there is none.
    int get() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

    /// Gives it away; the caller closes it.
    [[nodiscard]] int release() { return std::exchange(number_, -1); }

    void reset(int number = -1) {
        if (int old = std::exchange(number_, number); old >= 0)
            ::close(old);
    }

private:
    int number_ = -1;
};

} // namespace tarn
