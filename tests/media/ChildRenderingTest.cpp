#include <cstring>
#include <semaphore>

#include "media/ChildRenderingFactory.h"
#include "tests/support/MediaFixture.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;
using State = RenderedSpan::State;

/// All that is rendered from a seek on.
struct Rendered {
    PcmBuffer buffer;
    State state = State::more;
    std::optional<Error> error;
    bool joined = true;
    nanoseconds end{0};
};

struct ChildRenderingTest : testing::Test, FilesOfTheService {
    ~ChildRenderingTest() override {
        onLoop([this] { rendering.reset(); });
    }

    /// Runs `work` on the player thread and waits for it.
    void onLoop(const std::function<void()>& work) {
        std::binary_semaphore done(0);
        loop.post([&] {
            work();
            done.release();
        });
        done.acquire();
    }

    void open(const std::filesystem::path& path) {
        const auto asset = openFile(path);
        onLoop([&] { rendering = factory.open(asset, [this] { more.release(); }).rendering; });
        ASSERT_NE(rendering, nullptr);
    }

    /// Renders until the end, a failure, or `limit` frames, in uneven pieces.
    Rendered renderAll(nanoseconds position, float rate, const PcmFormat& format,
                       std::size_t limit = 1 << 30) {
        Rendered all;
        onLoop([&] { rendering->seek(position, rate, format); });
        std::optional<nanoseconds> last;
        for (std::size_t piece = 1; all.buffer.frames < limit; piece = piece * 3 % 6'007 + 1) {
            RenderedSpan span;
            onLoop([&] { span = rendering->render(all.buffer, std::min(piece, limit - all.buffer.frames)); });
            all.joined = all.joined && (!last || *last == span.start);
            last = span.end;
            all.end = span.end;
            all.state = span.state;
            all.error = span.error;
            if (span.state == State::waiting && !more.try_acquire_for(15s))
                ADD_FAILURE() << "nothing more came";
            if (span.state == State::ended || span.state == State::failed)
                break;
        }
        return all;
    }

    TemporaryFolder folder;
    EventLoopThread loop;
    ChildRenderingFactory factory{loop, process, porter};
    std::counting_semaphore<> more{0};
    std::unique_ptr<Rendering> rendering;
};

constexpr PcmFormat sixteenBits{SampleFormat::s16, 44100, 2};

TEST_F(ChildRenderingTest, BringsEveryFrameFromEverySeekInEveryFormat) {
    const Recording recording = makeSweep(300'001, 44100, 2);
    writeWav(folder / "recording.wav", recording);
    open(folder / "recording.wav");
    std::filesystem::remove(folder / "recording.wav");
    for (const std::size_t first : {0u, 290'000u, 44'100u, 300'000u, 1u}) {
        const nanoseconds position(static_cast<std::int64_t>(first) * 1'000'000'000 / 44100);
        const Rendered all = renderAll(position, 1, sixteenBits);
        EXPECT_EQ(all.state, State::ended) << first;
        EXPECT_TRUE(all.joined) << first;
        EXPECT_EQ(all.end.count(), 300'001 * 1'000'000'000LL / 44100);
        ASSERT_EQ(all.buffer.frames, 300'001 - first);
        EXPECT_EQ(std::memcmp(all.buffer.bytes.data(), recording.samples.data() + first * 2,
                              all.buffer.bytes.size()),
                  0);
        // What was on its way in another format, of a larger frame, is of no use.
        renderAll(0s, 1, {SampleFormat::f32, 44100, 8}, 20'000);
    }
    const Rendered backwards = renderAll(1s, -1, sixteenBits);
    EXPECT_EQ(backwards.buffer.frames, 44'100u);
    EXPECT_EQ(backwards.end, 0s);
    EXPECT_EQ(std::memcmp(backwards.buffer.bytes.data() + 4, recording.samples.data() + 44'098 * 2, 4), 0);
}

TEST_F(ChildRenderingTest, FailsWithTheReasonWhereItsFileDoes) {
    writeWav(folder / "source.wav", makeSweep(300'000, 44100, 2));
    encodeAudio(folder / "source.wav", "", folder / "cut.flac");
    std::filesystem::resize_file(folder / "cut.flac", std::filesystem::file_size(folder / "cut.flac") / 2);
    open(folder / "cut.flac");
    const Rendered all = renderAll(0s, 1, sixteenBits);
    ASSERT_EQ(all.state, State::failed);
    EXPECT_EQ(all.error->code, static_cast<std::int64_t>(MediaErrorCode::truncated));
    EXPECT_GT(all.buffer.frames, 100'000u);
}

} // namespace
} // namespace tarn
