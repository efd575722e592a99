#include <cmath>
#include <numbers>
#include <optional>

#include "rendering/ItemRendering.h"
#include "tests/support/DecodingFixture.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

/// All that a rendering makes from a seek on, and what media each of its frames plays.
struct Rendered {
    PcmBuffer buffer;
    std::vector<MediaSpan> spans;

    std::int64_t positionOf(std::size_t frame) const {
        std::size_t first = 0;
        for (const MediaSpan& span : spans) {
            if (frame < first + span.frames)
                return span.start + (span.end - span.start) * static_cast<std::int64_t>(frame - first) /
                                        static_cast<std::int64_t>(span.frames);
            first += span.frames;
        }
        return spans.back().end;
    }
};

Rendered renderAll(ItemRendering& rendering, std::size_t limit = 100'000'000) {
    Rendered all;
    do {
        const std::size_t before = all.buffer.frames;
        all.spans.push_back(rendering.render(all.buffer, 5'000));
        EXPECT_EQ(all.spans.back().frames, all.buffer.frames - before);
        const MediaSpan& previous = all.spans[all.spans.size() - std::min<std::size_t>(2, all.spans.size())];
        EXPECT_EQ(all.spans.back().start, all.spans.size() > 1 ? previous.end : all.spans.back().start)
            << "spans join";
    } while (all.spans.back().state == MediaSpan::State::more && all.buffer.frames < limit);
    return all;
}

struct RenderedFile {
    explicit RenderedFile(const std::filesystem::path& path)
        : file(path), rendering(*file.decoder, file.info) {}

    DecodedFile file;
    ItemRendering rendering;
};

struct RenderingTest : testing::Test {
    ItemRendering& open(const std::filesystem::path& path) { return opened.emplace(path).rendering; }

    ItemRendering& open(const Recording& recording) {
        writeWav(folder / "recording.wav", recording);
        return open(folder / "recording.wav");
    }

    TemporaryFolder folder;
    std::optional<RenderedFile> opened;
};

constexpr PcmFormat sixteenBits{SampleFormat::s16, 44100, 2};

TEST_F(RenderingTest, TouchesNoSampleAtRateOneInTheFilesOwnFormat) {
    const Recording recording = makeSweep(100'001, 44100, 2);
    ItemRendering& rendering = open(recording);
    rendering.seek(0ns, 1, sixteenBits);
    const Rendered all = renderAll(rendering);
    ASSERT_EQ(all.buffer.bytes.size(), recording.samples.size() * 2);
    EXPECT_EQ(std::memcmp(all.buffer.bytes.data(), recording.samples.data(), all.buffer.bytes.size()), 0);
    EXPECT_EQ(all.spans.back().end, (100'001 * 1'000'000'000LL + 22'050) / 44100);

    for (const SampleFormat wider : {SampleFormat::s24In32, SampleFormat::s32, SampleFormat::f32}) {
        rendering.seek(1s, 1, {wider, 44100, 2});
        const auto samples = toFloats(renderAll(rendering).buffer, wider);
        EXPECT_EQ(difference(samples, toFloats(recording), 44'100, 2), 0.0) << static_cast<int>(wider);
    }
}

TEST_F(RenderingTest, ConvertsTheRateToTheSamePlacesAfterEverySeek) {
    const Recording recording = makeSweep(150'000, 44100, 2);
    ItemRendering& rendering = open(recording);
    const PcmFormat format{SampleFormat::f32, 48000, 2};
    rendering.seek(0ns, 1, format);
    const Rendered all = renderAll(rendering);
    EXPECT_EQ(all.buffer.frames, (150'000u * 480 + 220) / 441);
    const auto whole = toFloats(all.buffer, format.sample);
    EXPECT_LT(difference(std::vector<float>(whole.begin(), whole.begin() + 96'000),
                         toFloats(makeSweep(150'000, 48000, 2)), 0, 2),
              1e-3)
        << "the same sweep, sampled at the other rate, but for its noise";
    for (const nanoseconds position : {1'234'567'890ns, 1ns, 2'999'999'999ns, 1'500'000'000ns}) {
        rendering.seek(position, 1, format);
        const auto part = toFloats(renderAll(rendering, 4'000).buffer, format.sample);
        const auto frame = std::llround(static_cast<double>(position.count()) * 48e-6);
        EXPECT_LT(difference(part, whole, frame, 2), 1e-9) << position.count();
    }
    rendering.seek(0ns, 1, {SampleFormat::s16, 48000, 1});
    EXPECT_EQ(renderAll(rendering).buffer.frames, all.buffer.frames);
}

TEST_F(RenderingTest, PlaysBackwards) {
    Recording recording = makeSweep(120'000, 44100, 2);
    ItemRendering& rendering = open(recording);
    rendering.seek(2s, -1, sixteenBits);
    const Rendered all = renderAll(rendering);
    EXPECT_EQ(all.spans.front().start, nanoseconds(2s).count());
    EXPECT_EQ(all.spans.back().end, nanoseconds(0s).count());
    EXPECT_EQ(all.spans.back().state, MediaSpan::State::ended);
    ASSERT_EQ(all.buffer.frames, 88'200u);
    const auto samples = toFloats(all.buffer, SampleFormat::s16);
    const auto forward = toFloats(recording);
    for (std::size_t frame = 0; frame < 88'200; ++frame)
        ASSERT_EQ(samples[frame * 2], forward[(88'199 - frame) * 2]) << frame;

    rendering.seek(2s, -2, sixteenBits);
    EXPECT_NEAR(static_cast<double>(renderAll(rendering).buffer.frames), 44'100, 100);
    rendering.seek(0s, -1, sixteenBits);
    EXPECT_EQ(renderAll(rendering).buffer.frames, 0u);
}

/// How often a signal crosses zero upwards, per second.
double frequency(const std::vector<float>& samples, double rate) {
    std::size_t crossings = 0;
    for (std::size_t i = 1; i < samples.size(); ++i)
        crossings += samples[i - 1] < 0 && samples[i] >= 0;
    return static_cast<double>(crossings) * rate / static_cast<double>(samples.size());
}

TEST_F(RenderingTest, OtherRatesKeepThePitchAndTheirPlaceInTime) {
    // A tone whose loudness jumps at every second.
    Recording recording{48000, 1, {}};
    constexpr int seconds = 40;
    for (int i = 0; i < 48000 * seconds; ++i) {
        const double loud = (i / 48000) % 2 == 0 ? 0.8 : 0.1;
        recording.samples.push_back(
            static_cast<std::int16_t>(32767 * loud * std::sin(2 * std::numbers::pi * 440 * i / 48000)));
    }
    ItemRendering& rendering = open(recording);
    for (const float rate : {0.25F, 0.4F, 0.9F, 1.1F, 1.75F, 2.0F, 3.0F, 4.0F, 7.0F, -1.5F}) {
        rendering.seek(rate > 0 ? 0s : nanoseconds(seconds * 1'000'000'000LL), rate,
                       {SampleFormat::f32, 48000, 1});
        const Rendered all = renderAll(rendering);
        const auto samples = toFloats(all.buffer, SampleFormat::f32);
        const double length = 48000.0 * seconds / std::fabs(rate);
        EXPECT_NEAR(static_cast<double>(samples.size()), length, 480) << rate;
        EXPECT_NEAR(frequency(samples, 48000), 440, 440 * 0.015) << rate;

        // Where the loudness changes the position must be at a whole second.
        const std::size_t window = 240;
        double before = 0;
        int changes = 0;
        for (std::size_t at = window; at + window < samples.size(); at += window) {
            double peak = 0;
            for (std::size_t i = at; i < at + window; ++i)
                peak = std::max(peak, static_cast<double>(std::fabs(samples[i])));
            if (before != 0 && (before < 0.3) != (peak < 0.3)) {
                const double position = static_cast<double>(all.positionOf(at)) / 1e9;
                EXPECT_NEAR(position, std::round(position), 0.02 + 0.015 * std::fabs(rate))
                    << rate << " at " << position;
                ++changes;
            }
            before = peak;
        }
        EXPECT_GE(changes, seconds - 5) << rate;
    }
}

TEST_F(RenderingTest, ARateBeyondAllMeansIsRenderedAsTheSpansTell) {
    ItemRendering& rendering = open(makeSweep(441'000, 44100, 2));
    rendering.seek(0s, 1'000, sixteenBits);
    const Rendered fast = renderAll(rendering);
    EXPECT_NEAR(static_cast<double>(fast.buffer.frames), 441'000 / Stretcher::fastest, 2'000);
    EXPECT_EQ(fast.spans.back().end, nanoseconds(10s).count());
    rendering.seek(5s, 1e-6F, sixteenBits);
    const Rendered slow = renderAll(rendering, 441'000);
    EXPECT_NEAR(static_cast<double>(slow.spans.back().end - slow.spans.front().start),
                1e9 * static_cast<double>(slow.buffer.frames) / 44100 * Stretcher::slowest, 1e6);
}

TEST_F(RenderingTest, TwoHalvesJoinToTheWholeInEveryLosslessFormat) {
    const Recording recording = makeSweep(100'000, 44100, 2);
    for (const char* name : {"half.wav", "half.flac", "half.m4a"}) {
        PcmBuffer joined;
        for (const auto& part : {recording.part(0, 33'333), recording.part(33'333, 100'000)}) {
            writeWav(folder / "part.wav", part);
            encodeAudio(folder / "part.wav", name == std::string("half.m4a") ? "-c:a alac" : "",
                        folder / name);
            ItemRendering& rendering = open(folder / name);
            rendering.seek(0s, 1, sixteenBits);
            while (rendering.render(joined, 4'000).state == MediaSpan::State::more) {
            }
        }
        ASSERT_EQ(joined.frames, 100'000u) << name;
        EXPECT_EQ(std::memcmp(joined.bytes.data(), recording.samples.data(), joined.bytes.size()), 0) << name;
    }
}

} // namespace
} // namespace tarn
