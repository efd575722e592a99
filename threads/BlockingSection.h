#pragma once

namespace tarn {

/// Stands around everything that may hold up the calling thread for long, such as waiting for another thread
/// or opening a file.
///
/// At its begin the answers that the thread has gathered in its burst are sent, since they must not wait as
/// long. On a worker it also sends another worker to the queues that this one would have gone on with. Work
/// that waits for anything outside of a blocking section may wait for work that nobody runs.
class BlockingSection {
public:
    BlockingSection();
    ~BlockingSection();
    BlockingSection(const BlockingSection&) = delete;
    BlockingSection& operator=(const BlockingSection&) = delete;

private:
    bool entered_; // false inside of another one, and on a thread that is no worker
};

} // namespace tarn
