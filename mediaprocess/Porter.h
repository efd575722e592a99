#pragma once

#include <string>
#include <vector>

#include "mediaprocess/MountTable.h"
#include "mediaprotocol/Channel.h"

namespace tarn {

/// Opens files for the service, and receives those that clients hand over: whatever a file system keeps
/// waiting is this process, which can be left behind. It reads none of them.
///
/// Files of this machine go to the service as they are. Closing any other might take for ever, and so might
/// the end of a process that holds one: those it parks, that is, sends into a socket that nobody reads, where
/// nothing hangs when they are dropped.
class Porter {
public:
    explicit Porter(Channel service) : service_(std::move(service)) {}

    /// Returns when the service wants no more, or has wanted nothing for as long as the channel waits.
    void run();

private:
    bool serve(ReceivedMessage& message);
    Ported openPath(const std::string& path, FileDescriptor& file);
    Ported receiveFile(FileDescriptor connection, std::size_t bytes, std::vector<FileDescriptor>& files);

    const Channel service_;
    MountTable mounts_;
};

} // namespace tarn
