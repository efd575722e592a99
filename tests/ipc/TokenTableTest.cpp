#include "ipc/TokenTable.h"

#include <fcntl.h>

#include <gtest/gtest.h>

#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

class ATokenTable : public testing::Test {
protected:
    ReceivedFile openSong() const {
        return {{FileForm::open, FileDescriptor(::open(song_.c_str(), O_RDONLY | O_CLOEXEC))}, {}};
    }

    std::string read(const std::string& path) {
        const auto file = table_.open(path);
        char text[16] = {};
        return file && ::pread(file->descriptor.get(), text, sizeof(text) - 1, 0) >= 0 ? text : "none";
    }

    TemporaryFolder folder_;
    std::string song_ = folder_.write("song", "music").string();
    TokenTable table_;
};

TEST_F(ATokenTable, OpensAPathWhileTheHandleOfItsTokenIsHeld) {
    EXPECT_EQ(table_.grant(1, "token", "/granted", openSong()), "");
    EXPECT_EQ(read("/granted"), "none");

    const auto handle = table_.consume("token");
    ASSERT_GE(handle, 0);
    EXPECT_EQ(read("/granted"), "music");
    EXPECT_EQ(read("/granted/"), "none");
    EXPECT_EQ(table_.consume("token"), -1) << "a token is good once";

    table_.release(handle);
    EXPECT_EQ(read("/granted"), "none");
}

TEST_F(ATokenTable, ForgetsWhatWaitsWhenItsConnectionEndsButNotWhatIsHeld) {
    EXPECT_EQ(table_.grant(1, "held", "/held", openSong()), "");
    const auto handle = table_.consume("held");
    EXPECT_EQ(table_.grant(1, "waiting", "/waiting", openSong()), "");
    EXPECT_EQ(table_.grant(2, "other", "/other", openSong()), "");

    table_.forget(1);

    EXPECT_EQ(table_.consume("waiting"), -1);
    EXPECT_GE(table_.consume("other"), 0);
    EXPECT_EQ(read("/held"), "music");
    table_.release(handle);
}

TEST_F(ATokenTable, PrefersTheNewestClientAndTheNewestGrant) {
    EXPECT_EQ(table_.grant(1, "token", "/first", openSong()), "");
    EXPECT_EQ(table_.grant(2, "token", "/second", openSong()), "");
    EXPECT_EQ(table_.grant(2, "token", "/third", openSong()), "");
    table_.consume("token");
    EXPECT_EQ(read("/third"), "music");
    table_.consume("token");
    EXPECT_EQ(read("/first"), "music");
    EXPECT_EQ(read("/second"), "none");
}

TEST_F(ATokenTable, LetsOneClientHaveOnlySoManyTokensWaiting) {
    for (std::size_t i = 0; i < TokenTable::mostWaiting; ++i)
        EXPECT_EQ(table_.grant(1, std::to_string(i), song_, openSong()), "");
    EXPECT_NE(table_.grant(1, "one more", song_, openSong()), "");
    EXPECT_EQ(table_.grant(1, "0", song_, openSong()), "") << "in place of one that waits";
    EXPECT_EQ(table_.grant(2, "one more", song_, openSong()), "") << "of another client";
    table_.consume("1");
    EXPECT_EQ(table_.grant(1, "one more", song_, openSong()), "");
}

} // namespace
} // namespace tarn
