#include "ipc/ReceivedFile.h"

#include <mutex>
#include <system_error>
#include <thread>
#include <vector>

namespace tarn {

namespace {

class Closer {
public:
    void take(FileDescriptor file) {
        {
            std::lock_guard lock(mutex_);
            files_.push_back(std::move(file));
            if (std::exchange(runs_, true))
                return;
        }
        try {
            std::thread([this] { closeAll(); }).detach();
        } catch (const std::system_error&) { // the system has no thread to give: somebody must wait
            closeAll();
        }
    }

private:
    void closeAll() {
        for (;;) {
            std::vector<FileDescriptor> closing; // once the lock has been let go
            std::lock_guard lock(mutex_);
            closing.swap(files_);
            runs_ = !closing.empty();
            if (!runs_)
                return;
        }
    }

    std::mutex mutex_; // guards what follows
    std::vector<FileDescriptor> files_;
    bool runs_ = false;
};

/// Never destroyed: its thread may be held up until the process ends.
Closer& closer() {
    static auto& shared = *new Closer;
    return shared;
}

} // namespace

ReceivedFile::~ReceivedFile() {
    if (file_)
        closer().take(std::move(file_));
}

} // namespace tarn
