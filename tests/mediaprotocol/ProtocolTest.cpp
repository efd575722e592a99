#include <fcntl.h>
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <numeric>
#include <vector>

#include "mediaprotocol/Channel.h"
#include "mediaprotocol/MediaError.h"
#include "mediaprotocol/RingReader.h"
#include "mediaprotocol/RingWriter.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using What = RingReader::Taken::What;

constexpr PcmFormat format{SampleFormat::s16, 1000, 2};
constexpr std::size_t capacity = 2'000; // two seconds

struct Ends {
    Ends() {
        reader.begin(1, format);
        EXPECT_TRUE(writer.begin(format, capacity));
    }

    /// `frames` frames that hold their own numbers, and a nanosecond each.
    void put(std::uint32_t generation, std::size_t frames, MediaSpan::State state = MediaSpan::State::more) {
        PcmBuffer buffer;
        buffer.frames = frames;
        buffer.bytes.resize(frames * 4);
        auto* numbers = reinterpret_cast<std::uint32_t*>(buffer.bytes.data());
        std::iota(numbers, numbers + frames, next);
        const std::int64_t start = next;
        next += static_cast<std::uint32_t>(frames);
        writer.put(buffer, {.generation = generation, .state = state, .start = start, .end = next});
    }

    RingMemory memory = *RingMemory::create();
    FileDescriptor descriptor{::dup(memory.descriptor())};
    RingReader reader{std::move(memory)};
    RingWriter writer{*RingMemory::map(descriptor)};
    RingMemory raw = *RingMemory::map(descriptor);
    std::uint32_t next = 0;
};

struct Ring : testing::Test, Ends {};

TEST_F(Ring, CarriesFramesAndWhereTheyLieThroughManyTurns) {
    std::uint32_t expected = 0;
    for (std::size_t piece = 1; piece < 400; ++piece) {
        put(1, piece);
        for (std::size_t taken = 0; taken < piece;) {
            PcmBuffer buffer;
            const auto part = reader.take(buffer, 150);
            ASSERT_EQ(part.what, What::span);
            ASSERT_EQ(part.span.start, expected) << "spans join, in parts too";
            for (std::size_t i = 0; i < buffer.frames; ++i, ++expected) {
                std::uint32_t number = 0;
                std::memcpy(&number, buffer.bytes.data() + i * 4, sizeof number);
                ASSERT_EQ(number, expected);
            }
            ASSERT_EQ(part.span.end, expected);
            taken += buffer.frames;
        }
        ASSERT_EQ(writer.room(), capacity);
    }
}

TEST_F(Ring, ThrowsAwayWhatWasMadeBeforeASeek) {
    PcmBuffer buffer;
    put(1, 300);
    EXPECT_EQ(reader.take(buffer, 100).span.frames, 100u);
    put(1, 300);
    const PcmFormat other{SampleFormat::f32, 8000, 1};
    reader.begin(2, other);
    EXPECT_EQ(reader.take(buffer, 100).what, What::nothing);
    EXPECT_EQ(writer.room(), capacity);
    put(1, 500); // on its way when the seek came
    ASSERT_TRUE(writer.begin(other, RingMemory::capacityFor(other)));
    EXPECT_EQ(writer.room(), 16'000u);
    put(2, 50, MediaSpan::State::ended);
    const auto last = reader.take(buffer, 100);
    EXPECT_EQ(last.span.start, 1'100);
    EXPECT_EQ(last.span.state, MediaSpan::State::ended);
}

TEST_F(Ring, OwesWordOnceWhenEnoughIsThere) {
    PcmBuffer buffer;
    reader.want(200);
    EXPECT_EQ(reader.take(buffer, 100).what, What::nothing);
    put(1, 100);
    EXPECT_FALSE(writer.owesWord());
    put(1, 100);
    EXPECT_TRUE(writer.owesWord());
    put(1, 100);
    EXPECT_FALSE(writer.owesWord());
    reader.want(400);
    put(1, 1, MediaSpan::State::ended);
    EXPECT_TRUE(writer.owesWord()) << "no more will come";
}

TEST(Channel, BringsNoMoreDescriptorsThanAreAskedFor) {
    const auto ends = Channel::makePair();
    const FileDescriptor file(::open("/dev/null", O_RDONLY | O_CLOEXEC));
    const int two[] = {file.get(), file.get()};
    ReceivedMessage message;
    for (const std::size_t room : {0u, 1u, 2u}) {
        ASSERT_EQ(ends->first.send(Taken{}, two), Channel::Result::done);
        EXPECT_EQ(ends->second.receiveNow(message, room),
                  room == 2 ? Channel::Result::done : Channel::Result::broken);
    }
    EXPECT_TRUE(message.as<Taken>() && !message.as<More>() && !message.as<Seek>());
    EXPECT_TRUE(message.takeFile(0) && message.takeFile(1));
    const int next = ::open("/dev/null", O_RDONLY | O_CLOEXEC);
    EXPECT_EQ(next, file.get() + 1) << "none of the others is left open";
    ::close(next);
    EXPECT_EQ(ends->second.receiveUntil(std::chrono::steady_clock::now() + 1ms, message),
              Channel::Result::notNow);
}

TEST(Records, AreCheckedBeforeTheyAreBelieved) {
    AudioFileInfo info{.format = {SampleFormat::f32, 48000, 2},
                       .firstFrame = -7,
                       .frames = 99,
                       .estimatedFrames = {},
                       .title = {},
                       .album = "\xC3\xA9",
                       .artist = ""};
    AudioFileInfo copy = *InfoRecord::of(info).checked();
    ASSERT_TRUE(TagsRecord::of(info).copyTo(copy));
    EXPECT_TRUE(copy.format == info.format && copy.firstFrame == -7 && copy.frames == 99);
    EXPECT_TRUE(copy.title == info.title && copy.album == info.album && copy.artist == info.artist);

    const std::function<void(InfoRecord&)> lies[] = {
        [](InfoRecord& record) { record.format.rate = 0; },
        [](InfoRecord& record) { record.format.channels = 1 << 20; },
        [](InfoRecord& record) { record.format.sample = 9; },
        [](InfoRecord& record) { record.frames = -1; },
        [](InfoRecord& record) { record.length = static_cast<InfoRecord::Length>(3); },
        [](InfoRecord& record) { record.firstFrame = INT64_MIN; },
    };
    for (const auto& lie : lies) {
        InfoRecord record = InfoRecord::of(info);
        lie(record);
        EXPECT_FALSE(record.checked()) << &lie - lies;
    }
    TagsRecord tags = TagsRecord::of(info);
    std::memset(static_cast<void*>(&tags.album), 1, sizeof tags.album);
    EXPECT_FALSE(tags.copyTo(copy)) << "longer than it can be";
    info.album = std::string(1'023, 'x') + "\xC3\xA9";
    EXPECT_EQ(TagsRecord::of(info).album.text(), std::string(1'023, 'x')) << "no half character";
    info.album = "a\nb";
    EXPECT_FALSE(TagsRecord::of(info).copyTo(copy));
    ErrorRecord error = ErrorRecord::of(mediaError(MediaErrorCode::truncated, "It ends.", "\x1B[2J"));
    EXPECT_EQ(error.toError().code, static_cast<std::int64_t>(MediaErrorCode::damaged));
}

} // namespace
} // namespace tarn
