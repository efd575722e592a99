#include "ipc/ListeningSocket.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <stdexcept>

#include "ipc/SocketAddress.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

class AListeningSocket : public testing::Test {
protected:
    AListeningSocket() { ::setenv("XDG_RUNTIME_DIR", folder_.path().c_str(), 1); }

    bool connects() const {
        const FileDescriptor probe(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        return SocketAddress(path_).connect(probe.get());
    }

    TemporaryFolder folder_;
    std::string path_ = (folder_ / "name").string();
};

TEST_F(AListeningSocket, IsThereForItsOwnUserUntilItGoes) {
    {
        ListeningSocket socket("name");
        struct stat status {};
        ASSERT_EQ(::stat(path_.c_str(), &status), 0);
        EXPECT_TRUE(S_ISSOCK(status.st_mode));
        EXPECT_EQ(status.st_mode & 0777U, 0600U);
        EXPECT_NE(::fcntl(socket.take().get(), F_GETFD) & FD_CLOEXEC, 0);
    }
    EXPECT_NE(::access(path_.c_str(), F_OK), 0);
}

TEST_F(AListeningSocket, ReplacesAFileThatNobodyListensOn) {
    FileDescriptor dead(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    ASSERT_TRUE(SocketAddress(path_).bind(dead.get()));
    dead.reset();
    EXPECT_FALSE(connects());
    const ListeningSocket socket("name");
    EXPECT_TRUE(connects());
}

TEST_F(AListeningSocket, LeavesOneOfAnotherProgramAlone) {
    const FileDescriptor other(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    ASSERT_TRUE(SocketAddress(path_).bind(other.get()));
    ASSERT_EQ(::listen(other.get(), 1), 0);
    EXPECT_THROW(ListeningSocket("name"), std::runtime_error);
    EXPECT_TRUE(connects());
}

} // namespace
} // namespace tarn
