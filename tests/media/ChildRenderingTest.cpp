#include <sys/mman.h>
#include <sys/socket.h>
#include <unistd.h>

#include <csignal>
#include <cstring>
#include <fstream>
#include <semaphore>

#include "media/ChildRendering.h"
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

/// The processes of this name whose parent is `parent`.
std::vector<pid_t> childrenOf(pid_t parent, const std::string& name) {
    std::vector<pid_t> found;
    for (const auto& entry : std::filesystem::directory_iterator("/proc")) {
        std::ifstream file(entry.path() / "stat");
        std::string pid;
        std::string command;
        std::string state;
        pid_t itsParent = 0;
        if (file >> pid >> command >> state >> itsParent && itsParent == parent &&
            command == "(" + name + ")")
            found.push_back(std::stoi(pid));
    }
    return found;
}

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
        onLoop([&] { rendering->seek(position, rate, format); });
        Rendered all;
        renderOn(all, limit);
        return all;
    }

    void renderOn(Rendered& all, std::size_t limit = 1 << 30) {
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

// Its file is in no file system that is known to answer, so it is held by its name, opened anew for each
// reader, and handed over parked.
TEST_F(ChildRenderingTest, PlaysAFileThatMayNotAnswer) {
    writeWav(folder / "a.wav", makeSweep(50'000, 44100, 2));
    std::ifstream wav(folder / "a.wav", std::ios::binary);
    const std::string bytes(std::istreambuf_iterator<char>(wav), {});
    const FileDescriptor memory(::memfd_create("song", MFD_CLOEXEC));
    ASSERT_EQ(::write(memory.get(), bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
    const std::string path = "/proc/" + std::to_string(::getpid()) + "/fd/" + std::to_string(memory.get());
    open(path);
    EXPECT_EQ(openFile(path)->file().form, FileForm::path);
    EXPECT_EQ(renderAll(0s, 1, sixteenBits).buffer.frames, 50'000u);
}

TEST_F(ChildRenderingTest, LosesOneItemWithAProcess) {
    writeWav(folder / "a.wav", makeSweep(500'000, 44100, 2));
    for (const int signal : {SIGKILL, SIGSEGV}) {
        open(folder / "a.wav");
        renderAll(0s, 1, sixteenBits, 10'000);
        const auto parents = childrenOf(::getpid(), "tarn-media");
        ASSERT_FALSE(parents.empty());
        std::vector<pid_t> renderers;
        for (const pid_t parent : parents)
            std::ranges::copy(childrenOf(parent, "tarn-renderer"), std::back_inserter(renderers));
        ASSERT_EQ(renderers.size(), 1u);
        ::kill(renderers[0], signal);
        const Rendered all = renderAll(0s, 1, sixteenBits);
        ASSERT_EQ(all.state, State::failed);
        EXPECT_EQ(all.error->code, static_cast<std::int64_t>(MediaErrorCode::damaged));

        open(folder / "a.wav");
        EXPECT_EQ(renderAll(0s, 1, sixteenBits).buffer.frames, 500'000u);
        onLoop([this] { rendering.reset(); });
    }
}

// Nothing that plays or is opened pays for the process that they were forked from.
TEST_F(ChildRenderingTest, GoesOnWhereItWasWhenTheParentEnds) {
    const Recording recording = makeSweep(500'000, 44100, 2);
    writeWav(folder / "a.wav", recording);
    for (const std::size_t before : {0, 10'000}) {
        open(folder / "a.wav");
        Rendered all = renderAll(0s, 1, sixteenBits, before);
        for (const pid_t parent : childrenOf(::getpid(), "tarn-media"))
            ::kill(parent, SIGSEGV);
        renderOn(all);
        EXPECT_EQ(all.state, State::ended);
        EXPECT_TRUE(all.joined);
        ASSERT_EQ(all.buffer.frames, 500'000u);
        EXPECT_EQ(std::memcmp(all.buffer.bytes.data(), recording.samples.data(), all.buffer.bytes.size()), 0);
        EXPECT_NE(openFile(folder / "a.wav"), nullptr);
        onLoop([this] { rendering.reset(); });
    }
}

TEST_F(ChildRenderingTest, BelievesNoMessageThatCannotBe) {
    const auto parent = MediaParent::start();
    ASSERT_NE(parent, nullptr);
    const std::function<void(const Channel&)> lies[] = {
        [](const Channel& service) { static_cast<void>(service.send(ChildIsIdle{})); },
        [](const Channel& service) { static_cast<void>(service.send(std::array<char, 3>{})); },
        [](const Channel& service) { ::send(service.socket(), nullptr, 0, 0); },
        [](const Channel& service) {
            static_cast<void>(service.send(ItemOpened{}, std::array{STDERR_FILENO}));
        },
        [](const Channel& service) {
            static_cast<void>(service.send(ItemOpened{}));
            static_cast<void>(service.send(ItemOpened{}));
        },
        [](const Channel& service) {
            static_cast<void>(service.send(ItemOpened{}));
            static_cast<void>(service.send(More{})); // was not asked for
        },
        [](const Channel& service) {
            static_cast<void>(service.send(ItemOpened{}));
            static_cast<void>(
                service.send(RenderingFailed{.generation = 7, .error = {}})); // of a seek that was not made
        },
    };
    for (const auto& lie : lies) {
        auto ends = Channel::makePair();
        auto ring = RingMemory::create();
        ASSERT_TRUE(ends && ring);
        lie(ends->second); // is all there before the first of it is read
        onLoop([&] {
            rendering = std::make_unique<ChildRendering>(
                loop, process,
                ChildRendering::Renderer{MediaChild(std::move(ends->first), parent, 1),
                                         RingReader(std::move(*ring))},
                std::nullopt, [this] { more.release(); }, [] { return std::nullopt; });
        });
        const Rendered all = renderAll(0s, 1, sixteenBits);
        ASSERT_EQ(all.state, State::failed) << &lie - lies;
        EXPECT_EQ(all.error->code, static_cast<std::int64_t>(MediaErrorCode::damaged)) << &lie - lies;
    }
}

} // namespace
} // namespace tarn
