#pragma once

#include <string>

namespace tarn {

/// Stands around work of a queue, on whichever thread runs it. The frames of a thread nest: work of one queue
/// may run a piece of another in place.
class QueueFrame {
public:
    /// Runs `work` as work of `queue`. What it throws ends the process.
    template <class Callable>
    static void run(const void* queue, Callable& work) noexcept {
        QueueFrame frame(queue);
        work();
    }

    /// Is the innermost frame of the calling thread one of `queue`?
    static bool isInnermost(const void* queue);

    /// Aborts with the label when the calling thread is inside work of `queue`: it would wait for itself.
    static void abortIfInside(const void* queue, const std::string& label);

    explicit QueueFrame(const void* queue);
    ~QueueFrame();
    QueueFrame(const QueueFrame&) = delete;
    QueueFrame& operator=(const QueueFrame&) = delete;

private:
    const void* queue_;
    const QueueFrame* outer_;
};

} // namespace tarn
