#include <cstring>
#include <fstream>

#include "decoder/Gapless.h"
#include "decoder/Tags.h"
#include "tests/decoder/MemorySource.h"
#include "tests/support/DecodingFixture.h"

namespace tarn {
namespace {

/// All that a file holds, and why no more of it; no error when it ends by itself.
std::pair<PcmBuffer, Error> playThrough(DecodedFile& file) {
    PcmBuffer buffer = file.read(10'000'000);
    return {std::move(buffer), file.state == Decoder::State::failed ? file.decoder->error() : Error{}};
}

struct ExaminationTest : testing::Test {
    ExaminationTest() { writeWav(folder / "source.wav", source); }

    std::filesystem::path encode(const std::string& arguments, const char* name) {
        encodeAudio(folder / "source.wav", arguments, folder / name);
        return folder / name;
    }

    const Recording source = makeSweep(100'003, 44100, 2);
    TemporaryFolder folder;
};

TEST(TagText, IsRepaired) {
    EXPECT_EQ(repairTagText("Caf\xC3\xA9 \xE2\x99\xAB"), "Caf\xC3\xA9 \xE2\x99\xAB");
    EXPECT_EQ(repairTagText("Caf\xE9"), "Caf\xC3\xA9");
    EXPECT_EQ(repairTagText("\xC3\xA9\xFF"), "\xC3\xA9\xEF\xBF\xBD");
    EXPECT_EQ(repairTagText("  one\ntwo\t"), "one two");
    EXPECT_EQ(repairTagText(std::string(5'000, 'x')).size(), 1'024u);
    const std::string cut = repairTagText(std::string(1'023, 'x') + "\xC3\xA9");
    EXPECT_EQ(cut, std::string(1'023, 'x')) << "no half character";
}

TEST_F(ExaminationTest, ReadsTagsOfEveryKind) {
    const std::string tags =
        "-metadata title='Caf\xC3\xA9 \xE2\x99\xAB' -metadata artist=Someone -metadata album=Place ";
    for (const char* name : {"a.mp3", "a.flac", "a.ogg", "a.opus", "a.m4a", "a.mka"}) {
        const DecodedFile file(encode(tags, name));
        EXPECT_EQ(file.info.title, "Caf\xC3\xA9 \xE2\x99\xAB") << name;
        EXPECT_EQ(file.info.album, "Place") << name;
        EXPECT_EQ(file.info.artist, "Someone") << name;
    }
}

TEST_F(ExaminationTest, CutsWhatAnITunesTagSaysWasAdded) {
    const std::string audio =
        contentOf(encode("-c:a libmp3lame -b:a 192k -write_xing 0 -id3v2_version 0", "plain.mp3"));
    std::string comment = std::string("\0eng", 4) + "iTunSMPB" + std::string(1, '\0') +
                          " 00000000 00000240 00000000 00000000000186A3 00000000 00000000";
    std::string frame =
        "COMM" + std::string(3, '\0') + static_cast<char>(comment.size()) + std::string(2, '\0') + comment;
    std::string header =
        "ID3" + std::string("\3\0\0\0\0", 5) + std::string(1, '\0') + static_cast<char>(frame.size());
    const DecodedFile file(folder.write("tagged.mp3", header + frame + audio));
    EXPECT_EQ(file.info.frames, 100'003);
    EXPECT_EQ(file.info.firstFrame, 0x240 + mp3DecoderDelay);
}

TEST_F(ExaminationTest, AFileThatIsCutOffKeepsItsPromisedLengthAndFailsThere) {
    for (const bool cutBefore : {true, false})
        for (const char* name : {"cut.flac", "cut.m4a", "cut.mp3", "cut.aiff", "cut.wav"}) {
            const auto path = encode(name == std::string("cut.m4a") ? "-movflags faststart" : "", name);
            const auto half = std::filesystem::file_size(path) / 2;
            if (cutBefore)
                std::filesystem::resize_file(path, half);
            DecodedFile file(path);
            std::filesystem::resize_file(path, half);
            EXPECT_NEAR(static_cast<double>(file.info.frames.value_or(0)), 100'003, 441) << name;
            const auto [buffer, error] = playThrough(file);
            EXPECT_EQ(error.code, static_cast<std::int64_t>(MediaErrorCode::truncated)) << name;
            EXPECT_GT(buffer.frames, 30'000u) << name << ": what is there is played";
            EXPECT_LT(buffer.frames, 95'000u) << name;
        }
}

TEST_F(ExaminationTest, AWavFileWhoseWriterDidNotKnowItsLengthIsWhole) {
    std::string bytes = contentOf(folder / "source.wav");
    for (const std::string& size : {std::string("\xFF\xFF\xFF\xFF"), std::string("\0\xF0\xFF\x7F", 4)}) {
        bytes.replace(bytes.find("data") + 4, 4, size);
        DecodedFile file(folder.write("piped.wav", bytes));
        EXPECT_EQ(file.info.frames, 100'003);
        const auto [buffer, error] = playThrough(file);
        EXPECT_EQ(error.code, 0);
        EXPECT_EQ(buffer.frames, 100'003u);
    }
}

TEST_F(ExaminationTest, AFileOf3GiBIsReadToItsEnd) {
    constexpr std::int64_t size = std::int64_t{3} << 30;
    std::string header = contentOf(folder / "source.wav");
    header.resize(header.find("data") + 8);
    const auto length = static_cast<std::uint32_t>(static_cast<std::size_t>(size) - header.size());
    std::memcpy(header.data() + header.size() - sizeof length, &length, sizeof length);
    const auto path = folder.write("long.wav", header);
    std::filesystem::resize_file(path, size - 4); // sparse
    std::ofstream(path, std::ios::app | std::ios::binary) << std::string("\1\0\2\0", 4);

    DecodedFile file(path);
    ASSERT_EQ(file.info.frames, length / 4);
    file.decoder->seek(length / 4 - 2);
    const PcmBuffer buffer = file.read(10);
    ASSERT_EQ(buffer.frames, 2u);
    EXPECT_EQ(std::memcmp(buffer.bytes.data(), "\0\0\0\0\1\0\2\0", 8), 0);
}

TEST_F(ExaminationTest, AFileThatCannotBeReadFailsWithItsReason) {
    const std::string bytes = contentOf(encode("-c:a flac", "faulty.flac"));
    MemorySource sound(bytes);
    const auto info = examineFile(sound).info;
    ASSERT_TRUE(info);
    for (const std::size_t part : {1u, 2u, 3u}) {
        MemorySource faulty(bytes, bytes.size() / 4 * part);
        FileDecoder decoder(faulty, *info);
        PcmBuffer buffer;
        auto error = decoder.open();
        while (!error)
            if (decoder.read(buffer, 10'000) != Decoder::State::more)
                error = decoder.error();
        EXPECT_EQ(error->code, static_cast<std::int64_t>(MediaErrorCode::cannotRead)) << part;
    }
}

} // namespace
} // namespace tarn
