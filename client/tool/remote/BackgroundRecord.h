#pragma once

#include <sys/types.h>

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "system/FileDescriptor.h"

namespace tarn::tool {

/// What "tarnctl play --detach" says of itself to other uses of the tool, in a file beside the service's
/// socket.
///
/// The process that plays holds a lock on the file for as long as it lives: so there is one at most, and what
/// a dead one has left there says nothing. For one thread.
class BackgroundRecord {
public:
    explicit BackgroundRecord(const std::string& socketPath);

    struct Content {
        pid_t process = 0;
        std::size_t track = 0; // that plays, from 1
        std::size_t tracks = 0;
        std::vector<std::string> problems; // with files that were not played; the last ones
    };
    /// None when nothing plays in the background.
    std::optional<Content> read() const;

    /// Ends the process that plays in the background, and waits for its end. False when there is none. Throws
    /// Problem when it does not end.
    bool endProcess() const;

    /// From now on this process is the one that plays; one before it is ended. Throws Problem when it cannot
    /// be.
    void claim();
    void setTrack(std::size_t track, std::size_t tracks);
    void addProblem(const std::string& problem);

private:
    std::optional<pid_t> holder(const FileDescriptor& file) const;
    void write() const;

    const std::string path_;
    FileDescriptor claimed_;
    Content content_;
};

} // namespace tarn::tool
