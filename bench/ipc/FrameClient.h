#pragma once

#include <chrono>
#include <cstdint>
#include <vector>

#include "ipc/FrameReader.h"

namespace tarn::bench {

/// Sends the same call over and over and counts the frames that come back; one thread, blocking. The same for
/// the service and for an echo, so that what differs is the other side.
class FrameClient {
public:
    /// Closes the socket. `sender`: who makes the frames that come back.
    FrameClient(FileDescriptor socket, Data call, FrameReader::Sender sender);

    /// How long each of `count` round trips took, one after the other.
    std::vector<std::chrono::nanoseconds> roundTrips(int count);

    enum class Writes {
        ofEachCall, // as libtarn writes them
        ofAllAtOnce // those that take the place of what was answered in one read
    };

    /// Round trips in a second with `ahead` calls on the way at all times.
    double rate(int count, int ahead, Writes writes);

private:
    void send(int calls);
    void send(int calls, Writes writes);
    int receive();

    FileDescriptor socket_;
    Data call_;
    FrameReader reader_;
    std::vector<std::uint8_t> buffer_;
};

} // namespace tarn::bench
