#include "threads/QueueFrame.h"

#include <cstdio>
#include <cstdlib>

namespace tarn {

namespace {

thread_local const QueueFrame* innermost = nullptr;

} // namespace

QueueFrame::QueueFrame(const void* queue) : queue_(queue), outer_(innermost) { innermost = this; }

QueueFrame::~QueueFrame() { innermost = outer_; }

bool QueueFrame::isInnermost(const void* queue) { return innermost != nullptr && innermost->queue_ == queue; }

void QueueFrame::abortIfInside(const void* queue, const std::string& label) {
    for (const QueueFrame* frame = innermost; frame != nullptr; frame = frame->outer_) {
        if (frame->queue_ != queue)
            continue;
        std::fprintf(stderr, "sync() on \"%s\" from work of that queue\n", label.c_str());
        std::abort();
    }
}

} // namespace tarn
