#include "client/tool/play/ServiceCheck.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <cstring>
#include <stdexcept>

#include "system/FileDescriptor.h"
#include "tests/ipc/TestServer.h"

namespace tarn::tool {
namespace {

using namespace std::chrono_literals;

TEST(TheServiceCheck, PassesWhenAServiceAnswers) {
    const TestServer server([](const ReceivedCall&) {}); // lets every call go
    client::Client client;
    EXPECT_NO_THROW(checkThatServiceAnswers(client));
}

TEST(TheServiceCheck, TellsOfASocketThatNobodyServes) {
    const TemporaryFolder folder;
    const auto path = (folder / "socket").string();
    const FileDescriptor held(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_un address{.sun_family = AF_UNIX, .sun_path = {}};
    std::strncpy(address.sun_path, path.c_str(), sizeof(address.sun_path) - 1);
    ASSERT_EQ(::bind(held.get(), reinterpret_cast<const sockaddr*>(&address), sizeof(address)), 0);
    ASSERT_EQ(::listen(held.get(), 1), 0);

    client::Client client({.socketPath = path});
    EXPECT_THROW(checkThatServiceAnswers(client, 10ms), std::runtime_error);
}

} // namespace
} // namespace tarn::tool
