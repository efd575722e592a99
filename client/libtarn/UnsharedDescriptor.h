#pragma once

#include <functional>

namespace tarn {

/// A child that the program makes with fork() gets a copy of every descriptor and of every object of the
/// library. With a copy of the socket it would keep the parent's connection open, and what it did to the
/// copy would reach the parent. So descriptors of the library are made as UnsharedDescriptor, which the child
/// closes before fork() returns in it, and objects ask a ForkMark whether they have been left behind.

/// Owns a descriptor that a fork of the program does not keep. Not thread-safe.
class UnsharedDescriptor {
public:
    UnsharedDescriptor() = default;
    /// Takes what `open` returns, -1 if it fails. No fork comes in between.
    explicit UnsharedDescriptor(const std::function<int()>& open);
    UnsharedDescriptor(UnsharedDescriptor&& other) noexcept;
    UnsharedDescriptor& operator=(UnsharedDescriptor&& other) noexcept;
    ~UnsharedDescriptor() { reset(); }

    /// -1 when there is none.
    int get() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }
    void reset();

private:
    int number_ = -1;
};

/// Remembers the process in which it was made.
class ForkMark {
public:
    ForkMark();

    /// Is this process a fork of the one in which this was made? Then the threads and descriptors of that
    /// time are not here, and its locks may be locked for ever. Any thread may ask.
    bool isLeftBehind() const;

private:
    unsigned forks_;
};

} // namespace tarn
