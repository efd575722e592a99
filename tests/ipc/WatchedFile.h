#pragma once

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "system/FileDescriptor.h"

namespace tarn {

/// A file to be sent, of which can be told whether whoever got it has closed it.
class WatchedFile {
public:
    WatchedFile() {
        int ends[2] = {-1, -1};
        EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
        other_.reset(ends[0]);
        file_.reset(ends[1]);
    }

    int get() const { return file_.get(); }

    /// Closes it here. Whether it was closed everywhere else, too, before the deadline.
    bool isClosed() {
        constexpr int deadlineMilliseconds = 10'000;
        file_.reset();
        pollfd end{other_.get(), 0, 0};
        return ::poll(&end, 1, deadlineMilliseconds) == 1 && (end.revents & POLLHUP) != 0;
    }

private:
    FileDescriptor other_;
    FileDescriptor file_;
};

} // namespace tarn
