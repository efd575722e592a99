#include "bench/ipc/FrameClient.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <utility>

namespace tarn::bench {

namespace {

constexpr std::size_t bufferSize = 65'536;

using SteadyTime = std::chrono::steady_clock;

} // namespace

FrameClient::FrameClient(FileDescriptor socket, Data call, FrameReader::Sender sender)
    : socket_(std::move(socket)), call_(std::move(call)), reader_(sender), buffer_(bufferSize) {}

void FrameClient::send(int calls) {
    Data bytes;
    for (int i = 0; i < calls; ++i)
        bytes.insert(bytes.end(), call_.begin(), call_.end());
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const auto count = ::send(socket_.get(), bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (count <= 0)
            std::abort();
        sent += static_cast<std::size_t>(count);
    }
}

void FrameClient::send(int calls, Writes writes) {
    if (writes == Writes::ofAllAtOnce)
        return send(calls);
    for (int i = 0; i < calls; ++i)
        send(1);
}

int FrameClient::receive() {
    std::vector<Frame> frames;
    const auto count = ::recv(socket_.get(), buffer_.data(), buffer_.size(), 0);
    if (count <= 0 || reader_.take({buffer_.data(), static_cast<std::size_t>(count)}, {}, frames)) {
        std::fprintf(stderr, "the other side ended the connection\n");
        std::abort();
    }
    return static_cast<int>(std::count_if(frames.begin(), frames.end(),
                                          [](const Frame& frame) { return frame.kind != FrameKind::event; }));
}

std::vector<std::chrono::nanoseconds> FrameClient::roundTrips(int count) {
    std::vector<std::chrono::nanoseconds> times;
    for (int i = 0; i < count; ++i) {
        const auto begin = SteadyTime::now();
        send(1);
        while (receive() == 0) {
        }
        times.push_back(SteadyTime::now() - begin);
    }
    std::sort(times.begin(), times.end());
    return times;
}

double FrameClient::rate(int count, int ahead, Writes writes) {
    const auto begin = SteadyTime::now();
    send(ahead, writes);
    int sent = ahead;
    for (int answered = 0; answered < count;) {
        const int now = receive();
        answered += now;
        const int next = std::min(now, count - sent);
        if (next > 0)
            send(next, writes);
        sent += std::max(next, 0);
    }
    return count / std::chrono::duration<double>(SteadyTime::now() - begin).count();
}

} // namespace tarn::bench
