#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <future>
#include <vector>

#include "ipc/SocketListener.h"
#include "tests/ipc/TestServer.h"

namespace tarn {
namespace {

/// A socket whose last close() waits: it cannot deliver what it was given before the other end goes, which it
/// does with this object.
class LingeringSocket {
public:
    LingeringSocket() {
        const FileDescriptor listener(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        auto* generic = reinterpret_cast<sockaddr*>(&address);
        socklen_t size = sizeof(address);
        EXPECT_EQ(::bind(listener.get(), generic, size), 0);
        EXPECT_EQ(::listen(listener.get(), 1), 0);
        EXPECT_EQ(::getsockname(listener.get(), generic, &size), 0);
        EXPECT_EQ(::connect(socket_.get(), generic, size), 0);
        other_.reset(::accept4(listener.get(), nullptr, nullptr, SOCK_CLOEXEC));
        const linger seconds{1, 60};
        EXPECT_EQ(::setsockopt(socket_.get(), SOL_SOCKET, SO_LINGER, &seconds, sizeof(seconds)), 0);
        const std::vector<char> much(1'000'000);
        while (::send(socket_.get(), much.data(), much.size(), MSG_DONTWAIT | MSG_NOSIGNAL) > 0) {
        }
    }

    int get() const { return socket_.get(); }

    /// Somebody else has it, too, or this waits.
    void letGo() { socket_.reset(); }

private:
    FileDescriptor other_;
    FileDescriptor socket_{::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)};
};

void sendBesideACall(const RawClient& client, const std::vector<int>& files) {
    Data call;
    appendFrame(call, FrameKind::call, 0, {});
    ASSERT_TRUE(client.sendWithFiles(call, files));
}

/// A way to leave a file to the service that it has no use for.
struct Way {
    const char* name;
    void (*send)(const RawClient& client, int file);
    std::size_t clientsBefore = 0;
};

const Way ways[] = {
    {"BesideACall", [](const RawClient& client, int file) { sendBesideACall(client, {file}); }},
    {"BehindManyOthers",
     [](const RawClient& client, int file) {
         std::vector files(253, STDERR_FILENO); // the most that go at once
         files.back() = file;
         sendBesideACall(client, files);
     }},
    {"InAGrantThatIsRefused",
     [](const RawClient& client, int file) {
         ASSERT_TRUE(client.grant("token", "/path", file) && client.send(FrameKind::call, 1));
     }},
    {"BehindWhatEndsTheConnection",
     [](const RawClient& client, int file) {
         ASSERT_TRUE(client.sendBytes(Data(100'000, 0xff))); // more than one read brings
         sendBesideACall(client, {file});
     }},
    {"OnAConnectionThatIsRefused", [](const RawClient& client, int file) { sendBesideACall(client, {file}); },
     SocketListener::mostConnections - 1}};

class ClosingTest : public testing::TestWithParam<Way> {};

// Closing may take as long as a client likes.
TEST_P(ClosingTest, IsWaitedForByNobody) {
    std::promise<void> begun;
    std::promise<void> mayGoOn;
    TestServer server([&](ReceivedCall call) {
        if (call.data == bytes("wait")) {
            begun.set_value();
            mayGoOn.get_future().wait();
        }
        call.reply.nothing();
    });
    auto other = server.connect();
    ASSERT_TRUE(other.send(FrameKind::call, 1, "wait"));
    begun.get_future().wait();
    std::vector<RawClient> before;
    for (std::size_t i = 0; i < GetParam().clientsBefore; ++i)
        before.push_back(server.connect());
    auto client = server.connect();
    LingeringSocket socket;
    GetParam().send(client, socket.get());
    socket.letGo(); // what is on its way is the last one
    mayGoOn.set_value();
    ASSERT_TRUE(other.receive());

    client.receive(); // the answer, or the end
    ASSERT_TRUE(other.send(FrameKind::call, 2));
    EXPECT_TRUE(other.receive());
}

INSTANTIATE_TEST_SUITE_P(, ClosingTest, testing::ValuesIn(ways),
                         [](const auto& way) { return way.param.name; });

} // namespace
} // namespace tarn
