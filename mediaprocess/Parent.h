#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>

#include "mediaprotocol/Channel.h"

namespace tarn {

/// Forks children for the service. It has loaded the libraries, which takes a hundred times as long as a
/// fork, and opens, receives and reads no file itself. It ends with its socket, and its children end with it.
class Parent {
public:
    explicit Parent(Channel service);

    /// In the parent it returns when the service wants no more; in a child when that has done its work.
    void run();

private:
    void serve(ReceivedMessage& message);
    void fork(const ForkRequest& request, FileDescriptor socket, FileDescriptor ring);
    void runChild(ChildKind kind, Channel service, const FileDescriptor& ring) const;
    void kill(std::uint64_t id) const;
    void reap();

    Channel service_;
    const pid_t self_;
    const std::uint64_t ownMemory_;
    std::map<pid_t, std::uint64_t> children_; // their ids
    bool isChild_ = false;
};

} // namespace tarn
