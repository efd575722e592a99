#include <fcntl.h>
#include <gmock/gmock.h>
#include <poll.h>
#include <pty.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstring>

#include "log/JournalSink.h"
#include "log/StandardErrorSink.h"
#include "system/FileDescriptor.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;

const LogRecord failure{LogLevel::error, LogCategory::standard, "-[Player play]", 7,
                        "-[Player play]:7: broken"};
const LogRecord progress{LogLevel::standard, LogCategory::extensionLoading, "load", 8, "load:8: done"};

/// A journal that reads when it is told to.
class Journal {
public:
    explicit Journal(const std::string& path) : socket_(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(static_cast<char*>(address.sun_path), sizeof address.sun_path - 1);
        EXPECT_EQ(bind(socket_, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    }
    ~Journal() { close(socket_); }
    Journal(const Journal&) = delete;
    Journal& operator=(const Journal&) = delete;

    std::vector<std::string> readAll() const {
        std::vector<std::string> records;
        std::array<char, 65536> buffer{};
        while (true) {
            const ssize_t size = recv(socket_, buffer.data(), buffer.size(), MSG_DONTWAIT);
            if (size < 0)
                return records;
            records.emplace_back(buffer.data(), static_cast<std::size_t>(size));
        }
    }

private:
    const int socket_;
};

class RecordingSink final : public LogSink {
public:
    void write(const LogRecord& record) override { messages.emplace_back(record.message); }
    std::vector<std::string> messages;
};

class AJournalSink : public testing::Test {
protected:
    TemporaryFolder folder;
    const std::string path = folder / "socket";
    std::shared_ptr<RecordingSink> fallback = std::make_shared<RecordingSink>();
    JournalSink sink{"tarnd", fallback, path};
};

TEST_F(AJournalSink, SendsEachRecordWithItsFields) {
    const Journal journal(path);
    sink.write(failure);
    sink.write(progress);
    EXPECT_THAT(
        journal.readAll(),
        ElementsAre("MESSAGE=-[Player play]:7: broken\nPRIORITY=3\nCODE_FUNC=-[Player play]\nCODE_LINE=7\n"
                    "SUBSYSTEM=ostrel.pellion\nCATEGORY=default\nSYSLOG_IDENTIFIER=tarnd\n",
                    "MESSAGE=load:8: done\nPRIORITY=6\nCODE_FUNC=load\nCODE_LINE=8\n"
                    "SUBSYSTEM=ostrel.pellion\nCATEGORY=extension_loading\nSYSLOG_IDENTIFIER=tarnd\n"));
    EXPECT_THAT(fallback->messages, ElementsAre());
}

TEST_F(AJournalSink, FallsBackWhileThereIsNoJournalAndFindsItAgain) {
    sink.write(failure);
    EXPECT_THAT(fallback->messages, ElementsAre(failure.message));
    const Journal journal(path);
    sink.write(failure);
    EXPECT_EQ(journal.readAll().size(), 1U);
    EXPECT_EQ(fallback->messages.size(), 1U);
}

TEST_F(AJournalSink, LosesRecordsRatherThanWaitForAStalledJournal) {
    const Journal journal(path);
    constexpr std::size_t count = 20'000;
    for (std::size_t index = 0; index < count; ++index)
        sink.write(failure);
    const std::size_t kept = journal.readAll().size();
    ASSERT_LT(kept, count);
    sink.write(failure);
    EXPECT_THAT(journal.readAll(),
                ElementsAre(HasSubstr(": " + std::to_string(count - kept) + " lines are missing here"),
                            StartsWith("MESSAGE=-[Player play]:7: broken\n")));
    EXPECT_THAT(fallback->messages, ElementsAre());
}

/// Both ends of a pipe or a socket pair.
struct Channel {
    explicit Channel(bool isPipe) {
        std::array<int, 2> ends{};
        const int failed = isPipe ? pipe2(ends.data(), O_CLOEXEC)
                                  : socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data());
        EXPECT_EQ(failed, 0);
        reading = ends[0];
        writing = ends[1];
        fcntl(reading, F_SETFL, O_NONBLOCK);
    }
    ~Channel() {
        close(reading);
        close(writing);
    }
    Channel(const Channel&) = delete;
    Channel& operator=(const Channel&) = delete;

    std::string readAll() const {
        std::string text;
        std::array<char, 65536> buffer{};
        for (ssize_t size = 0; (size = read(reading, buffer.data(), buffer.size())) > 0;)
            text.append(buffer.data(), static_cast<std::size_t>(size));
        return text;
    }

    int reading = -1;
    int writing = -1;
};

class AStandardErrorSink : public testing::TestWithParam<bool> {
protected:
    Channel channel{GetParam()};
    StandardErrorSink sink{channel.writing};
};

TEST_P(AStandardErrorSink, WritesLinesWithTheirPriority) {
    sink.write(failure);
    sink.write(progress);
    EXPECT_EQ(channel.readAll(), "<3>-[Player play]:7: broken\n<6>load:8: done\n");
}

TEST_P(AStandardErrorSink, LosesWholeLinesRatherThanWaitForItsReader) {
    for (int count = 0; count < 20'000; ++count)
        sink.write(failure);
    const std::string kept = channel.readAll();
    const std::string line = "<3>-[Player play]:7: broken\n";
    EXPECT_EQ(kept.size() % line.size(), 0U);
    EXPECT_LT(kept.size(), 20'000 * line.size());
    sink.write(failure);
    const std::size_t lost = 20'000 - kept.size() / line.size();
    EXPECT_THAT(channel.readAll(),
                AllOf(StartsWith("<3>"), HasSubstr(std::to_string(lost) + " lines are missing"),
                      EndsWith("\n" + line)));
    sink.write(failure);
    EXPECT_EQ(channel.readAll(), line) << "it is told once";
}

INSTANTIATE_TEST_SUITE_P(PipesAndSockets, AStandardErrorSink, testing::Bool());

TEST(AStandardErrorSinkOnATerminal, DoesNotWaitForItToGoOn) {
    int master = -1;
    int terminal = -1;
    ASSERT_EQ(openpty(&master, &terminal, nullptr, nullptr, nullptr), 0);
    fcntl(master, F_SETFL, O_NONBLOCK);
    StandardErrorSink sink(terminal);
    for (int count = 0; count < 20'000; ++count)
        sink.write(failure);
    std::string shown;
    std::array<char, 4096> buffer{};
    while (shown.find("lines are missing here") == std::string::npos) {
        pollfd entry{master, POLLIN, 0};
        ASSERT_EQ(poll(&entry, 1, 10'000), 1) << "what it took is shown, and then there is room";
        while (const ssize_t size = std::max<ssize_t>(read(master, buffer.data(), buffer.size()), 0))
            shown.append(buffer.data(), static_cast<std::size_t>(size));
        sink.write(failure);
    }
    EXPECT_THAT(shown, StartsWith("-[Player play]:7: broken\r\n-[Player play]:7: broken\r\n"));
    EXPECT_EQ(shown.find("broken-["), std::string::npos) << "lines are whole";
    close(terminal);
    close(master);
}

} // namespace
} // namespace tarn
