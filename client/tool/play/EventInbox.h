#pragma once

#include <sys/eventfd.h>

#include <mutex>
#include <utility>
#include <vector>

#include <tarn/Event.h>

#include "system/FileDescriptor.h"

namespace tarn::tool {

/// Events on their way to a loop that also waits for keys and signals. Any thread may put.
class EventInbox {
public:
    /// Readable while there are events.
    int descriptor() const { return ready_.get(); }

    void put(const client::Event& event) {
        std::lock_guard lock(mutex_);
        events_.push_back(event);
        eventfd_write(ready_.get(), 1);
    }

    std::vector<client::Event> takeAll() {
        std::lock_guard lock(mutex_);
        eventfd_t ignored = 0;
        eventfd_read(ready_.get(), &ignored);
        return std::exchange(events_, {});
    }

private:
    std::mutex mutex_;
    std::vector<client::Event> events_;
    FileDescriptor ready_{::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)};
};

} // namespace tarn::tool
