#include "tests/system/transport/ServiceUnderTest.h"

#include <poll.h>
#include <sys/socket.h>

#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>

#include "ipc/SocketAddress.h"

namespace tarn {

namespace {

constexpr int deadlineMilliseconds = 20'000;

} // namespace

void ServiceUnderTest::start() {
    const auto readyPath = (folder_ / "ready").string();
    const FileDescriptor ready(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    ASSERT_TRUE(SocketAddress(readyPath).bind(ready.get()));
    const std::string folder = folder_.path();
    // Of two settings of one name the first one counts.
    std::vector<std::string> environment = {"XDG_RUNTIME_DIR=" + folder, "NOTIFY_SOCKET=" + readyPath,
                                            "JOURNAL_STREAM=", "LISTEN_FDS=1", "LISTEN_FDNAMES=ostrel.tarnd"};
    environment.insert(environment.end(), environment_.begin(), environment_.end());
    environment.insert(environment.end(),
                       {"HOME=" + folder, "XDG_DATA_HOME=" + folder, "XDG_DATA_DIRS=" + folder, "LANG=C",
                        "TARND_SOUND=none", "DBUS_SESSION_BUS_ADDRESS=unix:path=/nowhere",
                        "DBUS_SYSTEM_BUS_ADDRESS=unix:path=/nowhere"});
    // bash, since the descriptor may have two digits.
    const auto handOver = "exec 3<&" + std::to_string(heldSocket_.get()) + "; LISTEN_PID=$$ exec " TARND;
    const auto command =
        heldSocket_ ? std::vector<std::string>{"bash", "-c", handOver} : std::vector<std::string>{TARND};
    process_ = std::make_unique<ChildProcess>(command, environment, ChildProcess::ErrorOutput::withOutput);
    pollfd wait{ready.get(), POLLIN, 0};
    ASSERT_EQ(::poll(&wait, 1, deadlineMilliseconds), 1) << "the service does not get ready";
    std::filesystem::remove(readyPath);
}

void ServiceUnderTest::holdSocket() {
    std::filesystem::remove(socketPath());
    heldSocket_.reset(::socket(AF_UNIX, SOCK_STREAM, 0)); // kept across exec
    ASSERT_TRUE(SocketAddress(socketPath()).bind(heldSocket_.get()));
    ASSERT_EQ(::listen(heldSocket_.get(), 1), 0);
}

int ServiceUnderTest::stop(int signal) {
    process_->signal(signal);
    return process_->wait();
}

void ServiceUnderTest::kill() {
    process_->signal(SIGKILL);
    process_->wait();
}

std::size_t ServiceUnderTest::entriesOf(const char* folder) const {
    const std::filesystem::directory_iterator entries("/proc/" + std::to_string(process_->pid()) + folder);
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

std::size_t ServiceUnderTest::openFiles() const { return entriesOf("/fd"); }

std::size_t ServiceUnderTest::threads() const { return entriesOf("/task"); }

std::string ServiceUnderTest::song(const std::string& name, std::uint32_t seconds) const {
    constexpr std::uint32_t rate = 8'000;
    std::string content("RIFF....WAVEfmt \x10\0\0\0\1\0\1\0....\0\0\0\0\1\0\x08\0data....", 44);
    const auto put = [&](std::size_t place, std::uint32_t value) {
        std::memcpy(&content[place], &value, sizeof(value));
    };
    put(4, 36 + rate * seconds);
    put(24, rate);
    put(28, rate);
    put(40, rate * seconds);
    return client::fileURL(
        folder_.write(name, content + std::string(std::size_t{rate} * seconds, '\x80')).string());
}

bool isServed(client::Client& client, const std::string& songURL) {
    return client.upsertAsset({.identifier = "asset", .URL = songURL}).get().outcome ==
               client::Outcome::answered &&
           client.upsertItem("item", "asset").get().outcome == client::Outcome::answered &&
           client.currentTime("item").get().outcome == client::Outcome::answered;
}

} // namespace tarn
