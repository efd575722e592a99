#include "bench/ipc/Echo.h"

#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <condition_variable>
#include <csignal>
#include <deque>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

namespace tarn::bench {

namespace {

using Bytes = std::vector<char>;

/// Passes pieces of bytes from one thread to the next, the cheapest way that waits.
class Baton {
public:
    void put(Bytes bytes) {
        {
            std::lock_guard lock(mutex_);
            pieces_.push_back(std::move(bytes));
        }
        changed_.notify_one();
    }

    Bytes take() {
        std::unique_lock lock(mutex_);
        changed_.wait(lock, [this] { return !pieces_.empty(); });
        Bytes bytes = std::move(pieces_.front());
        pieces_.pop_front();
        return bytes;
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<Bytes> pieces_;
};

void sendAll(int socket, const Bytes& bytes) {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const auto count = ::send(socket, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (count <= 0)
            _exit(0);
        sent += static_cast<std::size_t>(count);
    }
}

[[noreturn]] void serve(int socket, int handOffs) {
    std::vector<std::unique_ptr<Baton>> batons;
    std::vector<std::thread> threads;
    batons.reserve(static_cast<std::size_t>(handOffs));
    threads.reserve(static_cast<std::size_t>(handOffs));
    for (int i = 0; i < handOffs; ++i)
        batons.push_back(std::make_unique<Baton>());
    for (std::size_t i = 0; i < batons.size(); ++i)
        threads.emplace_back([&batons, i, socket] {
            while (true) {
                auto bytes = batons[i]->take();
                if (i + 1 < batons.size())
                    batons[i + 1]->put(std::move(bytes));
                else
                    sendAll(socket, bytes);
            }
        });
    std::array<char, 65'536> buffer{};
    while (true) {
        const auto count = ::recv(socket, buffer.data(), buffer.size(), 0);
        if (count <= 0)
            _exit(0);
        Bytes bytes(buffer.data(), buffer.data() + count);
        if (batons.empty())
            sendAll(socket, bytes);
        else
            batons.front()->put(std::move(bytes));
    }
}

} // namespace

Echo::Echo(int handOffs) {
    std::array<int, 2> ends{};
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0)
        std::abort();
    pid_ = ::fork();
    if (pid_ == 0) {
        ::close(ends[0]);
        serve(ends[1], handOffs);
    }
    ::close(ends[1]);
    socket_ = ends[0];
}

Echo::~Echo() {
    ::kill(pid_, SIGKILL);
    ::waitpid(pid_, nullptr, 0);
}

} // namespace tarn::bench
