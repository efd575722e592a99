#pragma once

#include <memory>
#include <vector>

namespace tarn {

/// A stretch of work on one thread whose small output leaves together: the answers to many commands in one
/// write.
///
/// Every worker holds one as long as it lives, and flushes it after each turn and before each wait.
class Burst {
public:
    /// Something whose output can wait. finishBurst() lets it out, on the thread that deferred it.
    class Deferred {
    public:
        virtual ~Deferred() = default;
        virtual void finishBurst() noexcept = 0;
    };

    /// Begins a burst on the calling thread, unless it is in one; the end flushes.
    Burst();
    ~Burst();
    Burst(const Burst&) = delete;
    Burst& operator=(const Burst&) = delete;

    /// Any thread: calls finishBurst() at the caller's next flush, once, however often it is deferred before;
    /// at once when the calling thread has no burst.
    static void defer(const std::shared_ptr<Deferred>& deferred);

    /// Any thread: lets out what has been deferred on it so far.
    static void flush();

private:
    std::vector<std::shared_ptr<Deferred>> deferred_;
};

} // namespace tarn
