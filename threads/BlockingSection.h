#pragma once

namespace tarn {

/// Stands around anything that may hold up the calling thread for long: waiting for another thread, opening
/// files.
///
/// First finishes what the thread's burst has deferred, so that no answer waits behind the block. On a worker
/// it also lets other workers take over the queues that this one would have gone on with. Code that runs on
/// a queue and waits for anything without it may wait for work that nobody runs.
class BlockingSection {
public:
    BlockingSection();
    ~BlockingSection();
    BlockingSection(const BlockingSection&) = delete;
    BlockingSection& operator=(const BlockingSection&) = delete;

private:
    bool entered_; // and not the one around it
};

} // namespace tarn
