#include <gtest/gtest.h>

#include <fstream>

#include "decoder/Examination.h"
#include "decoder/FileDecoder.h"
#include "decoder/LengthMeasurement.h"
#include "decoder/Pictures.h"
#include "tests/decoder/MemorySource.h"
#include "tests/support/AudioFixture.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

std::string bytesOf(std::uint64_t value, int count) {
    std::string digits;
    for (int i = count - 1; i >= 0; --i)
        digits.push_back(static_cast<char>(value >> (8 * i)));
    return digits;
}

struct FileTest : testing::Test {
    std::string encode(const std::string& arguments, const char* name, std::size_t frames = 100'003) {
        writeWav(folder / "source.wav", makeSweep(frames, 44'100, 2));
        encodeAudio(folder / "source.wav", arguments, folder / name);
        return contentOf(folder / name);
    }

    TemporaryFolder folder;
};

void run(const std::string& command) {
    ASSERT_EQ(std::system(("ffmpeg -nostdin -v error -y " + command).c_str()), 0); // NOLINT: a fixture's
}

/// Frames [at, at + count) of a file of 16-bit mono, and how the reading ended.
std::pair<std::vector<std::int16_t>, Decoder::State> readAt(FileDecoder& decoder, std::int64_t at,
                                                            std::size_t count) {
    decoder.seek(at);
    PcmBuffer buffer;
    Decoder::State state = Decoder::State::more;
    while (state == Decoder::State::more && buffer.frames < count)
        state = decoder.read(buffer, count - buffer.frames);
    std::vector<std::int16_t> samples(buffer.frames);
    std::memcpy(samples.data(), buffer.bytes.data(), samples.size() * 2);
    return {samples, state};
}

/// A FLAC file of `frames` frames of 65,535 samples each, 15 bytes long or less. All samples of frame n are n
/// modulo 20,000.
std::string tinyFlac(int frames) {
    constexpr int block = 65'535;
    const std::uint64_t total = static_cast<std::uint64_t>(frames) * block;
    std::string file =
        "fLaC" + bytesOf(0x80000022, 4) + bytesOf(block, 2) + bytesOf(block, 2) + bytesOf(0, 6) +
        bytesOf(std::uint64_t{192'000} << 44 | std::uint64_t{15} << 36 | total, 8) + std::string(16, '\0');
    const auto checkSum = [](std::string_view bytes, unsigned polynomial, int width) {
        unsigned sum = 0;
        for (const char byte : bytes) {
            sum ^= static_cast<unsigned>(static_cast<unsigned char>(byte)) << (width - 8);
            for (int bit = 0; bit < 8; ++bit)
                sum = (sum >> (width - 1) & 1) != 0 ? sum << 1 ^ polynomial : sum << 1;
            sum &= (1U << width) - 1;
        }
        return bytesOf(sum, width / 8);
    };
    for (unsigned n = 0; n < static_cast<unsigned>(frames); ++n) {
        std::string number; // in the manner of UTF-8
        const int size = n < 0x80 ? 1 : n < 0x800 ? 2 : n < 0x10000 ? 3 : 4;
        for (int i = 0; i < size; ++i)
            number.insert(number.begin(), static_cast<char>((n >> (6 * i) & 63) | 0x80));
        number[0] = static_cast<char>(n >> (6 * (size - 1)) | (size == 1 ? 0 : 0xF00U >> size));
        std::string frame = bytesOf(0xFFF87008, 4) + number + bytesOf(block - 1, 2);
        frame += checkSum(frame, 7, 8);
        frame += '\0' + bytesOf(n % 20'000, 2);
        file += frame + checkSum(frame, 0x8005, 16);
    }
    return file;
}

// What FFmpeg has to say of the fixtures is of no interest.
const bool quiet = [] {
    av_log_set_level(AV_LOG_QUIET);
    return true;
}();

TEST_F(FileTest, AFlacFileOfMoreThan32BitsOfFramesIsSoughtInToTheFrame) {
    MemorySource source(tinyFlac(65'540));
    const auto info = examineFile(source).info;
    ASSERT_TRUE(info);
    ASSERT_EQ(info->frames, 65'540LL * 65'535);
    FileDecoder decoder(source, *info);
    ASSERT_FALSE(decoder.open());
    const std::int64_t before = source.bytesRead();
    for (const std::int64_t frame : {65'539LL, 40'000LL, 3LL, 65'000LL}) {
        const auto [samples, state] = readAt(decoder, frame * 65'535 - 1, 2);
        EXPECT_EQ(samples, (std::vector{static_cast<std::int16_t>((frame - 1) % 20'000),
                                        static_cast<std::int16_t>(frame % 20'000)}));
    }
    EXPECT_LT(source.bytesRead() - before, source.size()) << "it is searched, not read through";
    const auto [samples, state] = readAt(decoder, *info->frames - 3, 10);
    EXPECT_EQ(samples.size(), 3u);
    EXPECT_EQ(state, Decoder::State::ended);
}

TEST_F(FileTest, ALongMp3WithoutALengthIsEstimatedAtOnceAndMeasuredLater) {
    // Its bit rate rises midway, so that the first frames alone say little.
    const std::string bare = "-c:a libmp3lame -write_xing 0 -id3v2_version 0 -b:a ";
    const std::string low = encode(bare + "64k", "low.mp3", 882'000);
    const std::string high = encode(bare + "320k", "high.mp3", 882'000);
    std::string file;
    while (file.size() < 10'000'000)
        file += low;
    const auto lowFrames = static_cast<std::int64_t>(file.size() / low.size()) * 767 * 1152;
    std::int64_t frames = lowFrames;
    for (int i = 0; i < 10; ++i, frames += 767 * 1152)
        file += high;

    MemorySource source(file);
    const auto info = examineFile(source).info;
    ASSERT_TRUE(info);
    EXPECT_LT(source.bytesRead(), source.size() / 8);
    EXPECT_FALSE(info->frames);
    const double exact = static_cast<double>(frames);
    EXPECT_NEAR(static_cast<double>(info->estimatedFrames.value_or(0)), exact, exact / 20);

    LengthMeasurement measurement(source, *info);
    LengthMeasurement::State state = LengthMeasurement::State::more;
    while (state == LengthMeasurement::State::more)
        state = measurement.step();
    ASSERT_EQ(state, LengthMeasurement::State::done);
    EXPECT_EQ(measurement.frames() / 1152, frames / 1152);
}

TEST_F(FileTest, APictureIsReadOnlyWhenItIsAskedFor) {
    const std::string path = (folder / "cover.png").string();
    run("-f lavfi -i 'nullsrc=s=700x500,geq=random(1)*255:random(2)*255:random(3)*255' -frames:v 1 " + path);
    const std::string cover = contentOf(path);
    MemorySource none(encode("", "none.mp3"));
    EXPECT_FALSE(readPicture(none));
    for (const char* name : {"a.mp3", "a.flac", "a.m4a"}) {
        run("-i " + (folder / "source.wav").string() + " -i " + path +
            " -map 0 -map 1 -c:v copy -metadata title=T -disposition:v attached_pic " +
            (folder / name).string());
        MemorySource source(contentOf(folder / name));
        ASSERT_GT(source.size(), 800'000) << name;
        const auto info = examineFile(source).info;
        ASSERT_TRUE(info && info->frames) << name;
        EXPECT_EQ(info->title, "T") << name;
        EXPECT_LT(source.bytesRead(), 500'000) << name;
        const auto picture = readPicture(source);
        ASSERT_TRUE(picture) << name;
        EXPECT_EQ(picture->mimeType, "image/png") << name;
        EXPECT_EQ(picture->bytes.size(), cover.size()) << name;
        EXPECT_EQ(std::memcmp(picture->bytes.data(), cover.data(), cover.size()), 0) << name;
    }
}

/// Makes the pages of an Ogg file valid again after their bytes were changed.
void mendOggCheckSums(std::string& file) {
    for (std::size_t page = 0; page != file.npos; page = file.find("OggS", page + 4)) {
        std::size_t end = page + 27 + static_cast<unsigned char>(file[page + 26]);
        for (std::size_t segment = page + 27, table = end; segment < table; ++segment)
            end += static_cast<unsigned char>(file[segment]);
        file.replace(page + 22, 4, 4, '\0');
        std::uint32_t sum = 0;
        for (std::size_t i = page; i < end; ++i) {
            sum ^= static_cast<std::uint32_t>(static_cast<unsigned char>(file[i])) << 24;
            for (int bit = 0; bit < 8; ++bit)
                sum = sum << 1 ^ ((sum >> 31) != 0 ? 0x04C11DB7U : 0U);
        }
        for (std::size_t i = 0; i < 4; ++i)
            file[page + 22 + i] = static_cast<char>(sum >> (8 * i));
    }
}

TEST_F(FileTest, OfSeveralTagsOfOneKindTheFirstIsMeantAndNoOtherThingIsATag) {
    for (const char* name : {"a.flac", "a.ogg", "a.opus", "flac.ogg"}) {
        const std::string codec = name == std::string("flac.ogg") ? "-c:a flac " : "";
        const std::string text(300, 'x'); // so that the comments go on over many segments
        std::string file = encode(codec + "-metadata comment=" + text + text +
                                      " -metadata artist='One;Two' -metadata artisu=Three -metadata album=A",
                                  name, 10'000);
        for (const std::string_view other : {"artisu", "ARTISU"})
            if (const std::size_t at = file.find(other); at != file.npos)
                file[at + 5] = other[4] == 's' ? 't' : 'T';
        for (const std::string_view other : {"artisu", "ARTISU"})
            ASSERT_EQ(file.find(other), file.npos) << name;
        if (file.starts_with("OggS"))
            mendOggCheckSums(file);
        MemorySource source(file);
        const auto info = examineFile(source).info;
        ASSERT_TRUE(info) << name;
        EXPECT_EQ(info->artist, "One;Two") << name;
        EXPECT_EQ(info->album, "A") << name;
    }

    MemorySource named(encode("-metadata:s:a:0 title=Stereo", "named.mka", 10'000));
    EXPECT_EQ(examineFile(named).info->title, std::nullopt) << "the name of a track";

    std::string aiff = encode("-metadata title=T", "a.aiff", 10'000);
    aiff.insert(12, "AUTH" + bytesOf(4, 4) + "Some");
    MemorySource authored(aiff);
    EXPECT_EQ(examineFile(authored).info->artist, "Some");
}

TEST_F(FileTest, WhatOnlyPretendsToBeSamplesIsNotPlayedAsNoise) {
    for (const char* coded : {"-ac 2 -strict -2 -c:a dca -b:a 1411k -f dts", "-c:a ac3 -b:a 448k -f spdif",
                              "-c:a ac3 -b:a 448k -f ac3"}) {
        encode(coded, "coded.bin", 300'000);
        run("-f s16le -ar 44100 -ac 2 -i " + (folder / "coded.bin").string() + " " +
            (folder / "coded.wav").string());
        MemorySource file(contentOf(folder / "coded.wav"));
        EXPECT_FALSE(examineFile(file).info) << coded;
    }
}

} // namespace
} // namespace tarn
