#pragma once

#include <string>

#include "media/ChildPool.h"
#include "roles/Error.h"
#include "system/HeldFile.h"

namespace tarn {

/// Has files opened by processes that may hang in a file system for as long as it likes. Any thread may call.
class FilePorter {
public:
    explicit FilePorter(MediaProcess& process) : process_(process), porters_(process, ChildKind::porter) {}

    struct Opened {
        SharedFile file;
        Error error; ///< meaningful when there is no file
    };

    /// Opens a regular file. Waits until the deadline at most.
    Opened open(const std::string& path, Channel::Deadline deadline);

    /// A file as it is sent to a child. Stays good as long as the file does.
    struct Loan {
        FileForm form = FileForm::none;
        int descriptor = -1;
        FileDescriptor owned; ///< is `descriptor`, when there had to be one for this
    };

    /// Never waits: a file that is only named will be opened by the time the child needs it, or not.
    Loan lend(const HeldFile& file);

    /// What came with the answer: none unless it is a file that can be held.
    static std::optional<HeldFile> heldFile(ReceivedMessage& message, const Ported& answer);

    /// For what else they can do.
    ChildPool& porters() { return porters_; }

    /// Lets all processes go that are not in use.
    void clear() { porters_.clear(); }

private:
    MediaProcess& process_;
    ChildPool porters_;
};

} // namespace tarn
