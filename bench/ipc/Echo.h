#pragma once

#include <sys/types.h>

#include <string>

namespace tarn::bench {

/// A server that sends back what it gets, in a process of its own: the floor that the service is measured
/// against. Ends with this object.
class Echo {
public:
    /// With `handOffs`, what comes goes through that many threads, the last of which sends it back.
    explicit Echo(int handOffs);
    ~Echo();
    Echo(const Echo&) = delete;
    Echo& operator=(const Echo&) = delete;

    /// The client's end of the connection; the caller closes it.
    int socket() const { return socket_; }

private:
    pid_t pid_ = -1;
    int socket_ = -1;
};

} // namespace tarn::bench
