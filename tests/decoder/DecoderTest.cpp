#include "tests/support/DecodingFixture.h"

namespace tarn {
namespace {

struct FileFormat {
    const char* name;
    const char* arguments;
    std::uint32_t rate;
    bool lossless;
    bool gapless;         ///< the format tells what its encoder added
    double noise = 1e-10; ///< some decoders make noise of their own
};

std::ostream& operator<<(std::ostream& stream, const FileFormat& format) { return stream << format.name; }

const FileFormat formats[] = {
    {"a.wav", "-c:a pcm_s16le", 44100, true, true},
    {"a24.wav", "-c:a pcm_s24le", 44100, true, true},
    {"float.wav", "-c:a pcm_f32le", 44100, true, true},
    {"a.aiff", "-c:a pcm_s16be", 44100, true, true},
    {"a.flac", "-c:a flac", 44100, true, true},
    {"a24.flac", "-c:a flac -sample_fmt s32 -bits_per_raw_sample 24", 44100, true, true},
    {"alac.m4a", "-c:a alac", 44100, true, true},
    {"aac.m4a", "-c:a aac -b:a 192k", 44100, false, true, 1e-3},
    {"raw.aac", "-c:a aac -b:a 192k", 44100, false, false, 1e-3},
    {"cbr.mp3", "-c:a libmp3lame -b:a 192k", 44100, false, true},
    {"vbr.mp3", "-c:a libmp3lame -q:a 2", 44100, false, true},
    {"headerless.mp3", "-c:a libmp3lame -q:a 2 -write_xing 0 -id3v2_version 0", 44100, false, false},
    {"a.ogg", "-c:a libvorbis -q:a 6", 44100, false, true},
    {"a.opus", "-c:a libopus -b:a 160k", 48000, false, true},
    {"opus.webm", "-c:a libopus -b:a 160k", 48000, false, true},
    {"vorbis.mka", "-c:a libvorbis -q:a 6", 44100, false, false},
    {"flac.mka", "-c:a flac", 44100, true, true},
    {"tta.mka", "-c:a tta", 44100, true, true},
};

struct DecoderTest : testing::TestWithParam<FileFormat> {
    // An odd length, so that no packet ends with the recording.
    static constexpr std::size_t length = 211'713;

    DecoderTest() {
        writeWav(folder / "source.wav", source);
        encodeAudio(folder / "source.wav", GetParam().arguments, folder / GetParam().name);
        file.emplace(folder / GetParam().name);
    }

    std::vector<float> readFrames(std::size_t frames) {
        return toFloats(file->read(frames), file->info.format.sample);
    }

    const Recording source = makeSweep(length, GetParam().rate, 2);
    TemporaryFolder folder;
    std::optional<DecodedFile> file;
};

TEST_P(DecoderTest, DecodesExactlyWhatWasEncoded) {
    const std::vector<float> whole = toFloats(source);
    const std::vector<float> decoded = readFrames(2 * length);
    EXPECT_EQ(file->state, Decoder::State::ended);
    EXPECT_EQ(decoded.size() / 2, static_cast<std::size_t>(file->info.frames.value_or(-1)))
        << "the duration is not what comes out";
    if (GetParam().gapless) {
        ASSERT_EQ(decoded.size(), whole.size());
    }
    if (GetParam().lossless) {
        EXPECT_EQ(difference(decoded, whole, 0, 2), 0.0);
    } else if (GetParam().gapless) {
        const std::vector<float> middle(decoded.begin() + 200'000, decoded.begin() + 208'000);
        EXPECT_EQ(displacement(middle, whole, 100'000, 2, 1'500), 0);
    }
}

TEST_P(DecoderTest, SeeksToTheFrame) {
    const std::vector<float> whole = readFrames(2 * length);
    for (const std::int64_t target : {150'001L, 3L, 0L, 44'100L, 200'000L, 1'151L, 209'000L, 100'000L}) {
        file->decoder->seek(target);
        const std::vector<float> part = readFrames(2'000);
        ASSERT_EQ(part.size(), 4'000u) << "at " << target;
        EXPECT_EQ(displacement(part, whole, target, 2, 1), 0) << "at " << target;
        EXPECT_LT(difference(part, whole, target, 2), GetParam().noise) << "at " << target;
    }
    file->decoder->seek(static_cast<std::int64_t>(whole.size() / 2) + 10);
    EXPECT_TRUE(readFrames(100).empty());
    EXPECT_EQ(file->state, Decoder::State::ended);
}

INSTANTIATE_TEST_SUITE_P(Formats, DecoderTest, testing::ValuesIn(formats), [](const auto& information) {
    std::string name = information.param.name;
    std::replace(name.begin(), name.end(), '.', '_');
    return name;
});

} // namespace
} // namespace tarn
