#include "tests/system/transport/ServiceUnderTest.h"

#include <poll.h>
#include <sys/socket.h>

#include <gtest/gtest.h>

#include <array>
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
    const std::string runtime = "XDG_RUNTIME_DIR=" + folder_.path().string();
    process_ = std::make_unique<ChildProcess>(
        std::vector<std::string>{TARND},
        std::vector<std::string>{runtime, "NOTIFY_SOCKET=" + readyPath, "PULSE_SERVER=unix:/nowhere",
                                 "DBUS_SESSION_BUS_ADDRESS=unix:path=/nowhere", "JOURNAL_STREAM="},
        ChildProcess::ErrorOutput::withOutput);
    pollfd wait{ready.get(), POLLIN, 0};
    ASSERT_EQ(::poll(&wait, 1, deadlineMilliseconds), 1) << "the service does not get ready";
    std::filesystem::remove(readyPath);
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

std::string ServiceUnderTest::song() const {
    constexpr std::size_t samples = 16'000;
    constexpr std::array<unsigned char, 44> header = {
        'R', 'I', 'F', 'F', 0xA4, 0x3E, 0,   0,   'W', 'A',  'V',  'E',  'f', 'm',  't',
        ' ', 16,  0,   0,   0,    1,    0,   1,   0,   0x40, 0x1F, 0,    0,   0x80, 0x3E,
        0,   0,   2,   0,   16,   0,    'd', 'a', 't', 'a',  0x80, 0x3E, 0,   0};
    const std::string content(header.begin(), header.end());
    return client::fileURL(folder_.write("song.wav", content + std::string(samples, '\0')).string());
}

bool isServed(client::Client& client, const std::string& songURL) {
    return client.upsertAsset({.identifier = "asset", .URL = songURL}).get().outcome ==
               client::Outcome::answered &&
           client.upsertItem("item", "asset").get().outcome == client::Outcome::answered &&
           client.currentTime("item").get().outcome == client::Outcome::answered;
}

} // namespace tarn
