#include "ipc/FrameReader.h"
#include "tests/ipc/RawClient.h"

#include <fcntl.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <numeric>
#include <string>

namespace tarn {
namespace {

using Sender = FrameReader::Sender;
using testing::HasSubstr;

std::vector<ReceivedFile> files(int count) {
    std::vector<ReceivedFile> made(static_cast<std::size_t>(count));
    for (auto& file : made)
        file.file = {FileForm::open, FileDescriptor(::open("/dev/null", O_RDONLY | O_CLOEXEC))};
    return made;
}

Data frame(FrameKind kind, std::uint64_t callId = 0, std::string_view body = {}) {
    Data stream;
    appendFrame(stream, kind, callId, bytes(body));
    return stream;
}

Data operator+(Data left, const Data& right) {
    left.insert(left.end(), right.begin(), right.end());
    return left;
}

std::string describe(const std::vector<Frame>& frames) {
    std::string text;
    for (const auto& each : frames)
        text += std::to_string(static_cast<int>(each.kind)) + ":" + std::to_string(each.callId) + ":" +
                std::string(each.body.begin(), each.body.end()) + (each.file ? "+file " : " ");
    return text;
}

TEST(FrameReader, ReadsTheSameFramesHoweverTheStreamIsSplit) {
    const Data stream = frame(FrameKind::call, 1, "one") + frame(FrameKind::call) +
                        frame(FrameKind::call, 0xFFEEDDCCBBAA9988, std::string(300, 'x'));
    const std::string whole = "1:1:one 1:0: 1:18441921395520346504:" + std::string(300, 'x') + " ";
    for (std::size_t first = 0; first <= stream.size(); ++first) {
        for (std::size_t second = first; second <= stream.size(); second += 7) {
            FrameReader reader(Sender::client);
            std::vector<Frame> frames;
            const std::span all(stream);
            for (const auto part :
                 {all.first(first), all.subspan(first, second - first), all.subspan(second)})
                ASSERT_FALSE(reader.take(part, {}, frames));
            ASSERT_EQ(describe(frames), whole) << first << " " << second;
            ASSERT_EQ(reader.unfinishedBytes(), 0U);
        }
    }
}

TEST(FrameReader, StopsAtWhatDoesNotFitTheRulesAndKeepsWhatCameBefore) {
    const auto with = [](std::size_t position, std::uint8_t value) {
        Data broken = frame(FrameKind::call, 7, "body");
        broken[position] = value;
        return broken;
    };
    const struct {
        const char* what;
        Data broken;
        const char* reason;
    } cases[] = {
        {"kind 0", with(4, 0), "kind"},
        {"kind 6", with(4, 6), "kind"},
        {"kind of the other side", with(4, 3), "kind"},
        {"first reserved byte", with(5, 1), "reserved"},
        {"last reserved byte", with(7, 0x80), "reserved"},
        {"one byte over the limit", {1, 0, 0x10, 0, 1, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0}, "too long"},
        {"negative length", with(3, 0xFF), "too long"},
        {"extension without file", frame(FrameKind::extension, 0, "x"), "without its file"},
        {"extension with a call id", frame(FrameKind::extension, 1), "call id"},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.what);
        FrameReader reader(Sender::client);
        std::vector<Frame> frames;
        const auto broken = reader.take(frame(FrameKind::call, 1, "good") + each.broken, {}, frames);
        ASSERT_TRUE(broken);
        EXPECT_THAT(std::string(*broken), HasSubstr(each.reason));
        EXPECT_EQ(describe(frames), "1:1:good ");
        EXPECT_EQ(reader.take(frame(FrameKind::call, 2), {}, frames), broken);
        EXPECT_EQ(frames.size(), 1U);
    }
}

TEST(FrameReader, GivesAFileToTheExtensionWithWhoseBytesItCame) {
    const Data call = frame(FrameKind::call, 1);
    const Data extension = frame(FrameKind::extension, 0, "token");
    {
        FrameReader reader(Sender::client);
        std::vector<Frame> frames;
        EXPECT_FALSE(reader.take(call + extension, files(1), frames));
        EXPECT_EQ(describe(frames), "1:1: 2:0:token+file ");
    }
    for (std::size_t cut = 1; cut < extension.size(); ++cut) {
        FrameReader reader(Sender::client);
        std::vector<Frame> frames;
        EXPECT_FALSE(reader.take(std::span(extension).first(cut), files(1), frames));
        EXPECT_FALSE(reader.take(std::span(extension).subspan(cut), {}, frames));
        EXPECT_EQ(describe(frames), "2:0:token+file ");
    }
}

TEST(FrameReader, RefusesFilesThatBelongToNoExtension) {
    const Data call = frame(FrameKind::call, 1, "body");
    const Data extension = frame(FrameKind::extension, 0, "token");
    const struct {
        const char* what;
        Data stream;
        int files;
    } cases[] = {
        {"beside a call", call, 1},
        {"beside a part of a call", Data(call.begin(), call.end() - 1), 1},
        {"with two for one extension", extension, 2},
        {"with two for a header that is not whole", Data(extension.begin(), extension.begin() + 3), 2},
        {"with one for an extension and a call behind it", extension + call, 2}};
    for (const auto& each : cases) {
        FrameReader reader(Sender::client);
        std::vector<Frame> frames;
        EXPECT_TRUE(reader.take(each.stream, files(each.files), frames)) << each.what;
    }
}

} // namespace
} // namespace tarn
