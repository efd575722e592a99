#pragma once

#include <memory>
#include <vector>

namespace tarn {

/// A stretch of work on one thread whose small output leaves together at its end, such as the answers to many
/// commands in one write.
///
/// A worker holds one burst from the moment it wakes up until it has nothing left to do, and flushes it at
/// least every millisecond.
class Burst {
public:
    /// Something that can wait for the end of a burst. finishBurst() runs on the thread that deferred it.
    class Deferred {
    public:
        virtual ~Deferred() = default;
        virtual void finishBurst() noexcept = 0;
    };

    /// Opens a burst on the calling thread, unless it is in one.
    Burst();
    ~Burst();
    Burst(const Burst&) = delete;
    Burst& operator=(const Burst&) = delete;

    /// Any thread: calls finishBurst() once at the end of the caller's burst, however often it is deferred
    /// before; at once when the caller is in no burst.
    static void defer(const std::shared_ptr<Deferred>& deferred);

    /// Any thread: finishes what the caller's burst has deferred so far.
    static void flush();

private:
    std::vector<std::shared_ptr<Deferred>> deferred_;
};

} // namespace tarn
