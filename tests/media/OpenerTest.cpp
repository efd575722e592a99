#include <sys/stat.h>

#include <atomic>
#include <cerrno>
#include <fstream>
#include <thread>

#include "decoder/Gapless.h"
#include "decoder/Tags.h"
#include "media/FileURL.h"
#include "tests/support/MediaFixture.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

std::string contentOf(const std::filesystem::path& path) {
    std::ifstream stream(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

MediaErrorCode refusal(const std::string& URL) {
    MediaAssetOutcome outcome = openURL(URL);
    EXPECT_EQ(outcome.asset, nullptr) << URL;
    EXPECT_EQ(outcome.error.domain, mediaErrorDomain) << URL;
    EXPECT_FALSE(outcome.error.userInfo[localizedDescriptionKey].empty()) << URL;
    return static_cast<MediaErrorCode>(outcome.error.code);
}

/// All that a file holds, and why no more of it; no error when it ends by itself.
std::pair<PcmBuffer, Error> playThrough(const LinuxMediaAsset& asset) {
    FileReader reader(asset.file());
    const auto opened = sharedLoader().load()->open(reader, asset.info());
    if (!opened.decoder)
        return {{}, opened.error};
    PcmBuffer buffer;
    Decoder::State state = Decoder::State::more;
    while (state == Decoder::State::more)
        state = opened.decoder->read(buffer, 10'000);
    return {buffer, state == Decoder::State::failed ? opened.decoder->error() : Error{}};
}

/// A file in memory that fails, or stops answering, from some byte on.
class FaultySource final : public ByteSource {
public:
    FaultySource(std::string bytes, std::size_t faultAt, int fault)
        : bytes_(std::move(bytes)), faultAt_(faultAt), fault_(fault) {}

    std::int64_t size() const override { return static_cast<std::int64_t>(bytes_.size()); }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override {
        const auto at = static_cast<std::size_t>(offset);
        if (at >= bytes_.size())
            return 0;
        if (at + size > faultAt_)
            return -fault_;
        size = std::min(size, bytes_.size() - at);
        std::memcpy(into, bytes_.data() + at, size);
        return static_cast<std::int64_t>(size);
    }
    bool expired() const override { return false; }

private:
    const std::string bytes_;
    const std::size_t faultAt_;
    const int fault_;
};

struct OpenerTest : testing::Test {
    OpenerTest() { writeWav(folder / "source.wav", source); }

    std::filesystem::path encode(const std::string& arguments, const char* name) {
        encodeAudio(folder / "source.wav", arguments, folder / name);
        return folder / name;
    }

    const Recording source = makeSweep(100'003, 44100, 2);
    TemporaryFolder folder;
};

TEST(FileURL, NamesFilesOfThisMachineOnly) {
    EXPECT_EQ(pathFromFileURL("file:///a/b%20c%C3%A9.mp3"), "/a/b c\xC3\xA9.mp3");
    EXPECT_EQ(pathFromFileURL("FILE://LocalHost/a"), "/a");
    EXPECT_EQ(pathFromFileURL("file:/a"), "/a");
    EXPECT_EQ(pathFromFileURL("file:///a?b#c"), "/a");
    for (const char* URL :
         {"", "/a", "a.mp3", "http://h/a", "file:a", "file://host/a", "file://", "file:///a%00b",
          "file:///a%4", "file:///a%zz", "concat:/a|/b", "subfile,,start,0,end,1,,:/a",
          "data:audio/wav;base64,AA", "fd:0", "pipe:0", "file://localhost.evil/a"})
        EXPECT_EQ(pathFromFileURL(URL), std::nullopt) << URL;
}

TEST(TagText, IsRepaired) {
    EXPECT_EQ(repairTagText("Caf\xC3\xA9 \xE2\x99\xAB"), "Caf\xC3\xA9 \xE2\x99\xAB");
    EXPECT_EQ(repairTagText("Caf\xE9"), "Caf\xC3\xA9");
    EXPECT_EQ(repairTagText("\xC3\xA9\xFF"), "\xC3\xA9\xEF\xBF\xBD");
    EXPECT_EQ(repairTagText("  one\ntwo\t"), "one two");
    EXPECT_EQ(repairTagText(std::string(5'000, 'x')).size(), 1'024u);
    const std::string cut = repairTagText(std::string(1'023, 'x') + "\xC3\xA9");
    EXPECT_EQ(cut, std::string(1'023, 'x')) << "no half character";
}

TEST(GaplessText, IsParsed) {
    const auto tag = parseITunSMPB(" 00000000 00000840 000001CA 00000000003F31F6 00000000");
    ASSERT_TRUE(tag);
    EXPECT_EQ(tag->delay, 0x840);
    EXPECT_EQ(tag->padding, 0x1CA);
    EXPECT_EQ(tag->recording, 0x3F31F6);
    EXPECT_FALSE(parseITunSMPB(" 00000000 00000840 000001CA"));
    EXPECT_FALSE(parseITunSMPB(" 00000000 FFFFFFFF 000001CA 00000000003F31F6"));
}

TEST_F(OpenerTest, ReadsTagsOfEveryKind) {
    const std::string tags =
        "-metadata title='Caf\xC3\xA9 \xE2\x99\xAB' -metadata artist=Someone -metadata album=Place ";
    for (const char* name : {"a.mp3", "a.flac", "a.ogg", "a.opus", "a.m4a", "a.mka"}) {
        const auto asset = openFile(encode(tags, name));
        ASSERT_NE(asset, nullptr);
        ASSERT_EQ(asset->commonMetadata().size(), 3u) << name;
        EXPECT_EQ(asset->commonMetadata()[0].key(), MediaMetadataItem::commonKeyTitle);
        EXPECT_EQ(asset->commonMetadata()[0].stringValue(), "Caf\xC3\xA9 \xE2\x99\xAB") << name;
        EXPECT_EQ(asset->commonMetadata()[1].stringValue(), "Place") << name;
        EXPECT_EQ(asset->commonMetadata()[2].stringValue(), "Someone") << name;
    }
}

TEST_F(OpenerTest, CutsWhatAnITunesTagSaysWasAdded) {
    const std::string audio =
        contentOf(encode("-c:a libmp3lame -b:a 192k -write_xing 0 -id3v2_version 0", "plain.mp3"));
    std::string comment = std::string("\0eng", 4) + "iTunSMPB" + std::string(1, '\0') +
                          " 00000000 00000240 00000000 00000000000186A3 00000000 00000000";
    std::string frame =
        "COMM" + std::string(3, '\0') + static_cast<char>(comment.size()) + std::string(2, '\0') + comment;
    std::string header =
        "ID3" + std::string("\3\0\0\0\0", 5) + std::string(1, '\0') + static_cast<char>(frame.size());
    const auto asset = openFile(folder.write("tagged.mp3", header + frame + audio));
    ASSERT_NE(asset, nullptr);
    EXPECT_EQ(asset->duration(), MediaTime(100'003, 44'100));
    EXPECT_EQ(asset->info().firstFrame, 0x240 + mp3DecoderDelay);
}

TEST_F(OpenerTest, RefusesWhatIsNotARegularFileOfAudio) {
    mkfifo((folder / "fifo").c_str(), 0600);
    const std::string here = fileURL(folder.path());
    EXPECT_EQ(refusal(here + "/fifo"), MediaErrorCode::notRegularFile);
    EXPECT_EQ(refusal(here), MediaErrorCode::notRegularFile);
    EXPECT_EQ(refusal("file:///dev/zero"), MediaErrorCode::notRegularFile);
    EXPECT_EQ(refusal("file:///dev/null"), MediaErrorCode::notRegularFile);
    refusal("file:///dev/tty");
    EXPECT_EQ(refusal(here + "/missing"), MediaErrorCode::cannotOpen);
    EXPECT_EQ(refusal("http://localhost/a.mp3"), MediaErrorCode::unsupportedURL);
    refusal("file:///proc/self/mem");

    const std::string path = (folder / "source.wav").string();
    const std::string texts[] = {"",
                                 "RIFF",
                                 "#EXTM3U\n#EXTINF:1\n" + path + "\n",
                                 "ffconcat version 1.0\nfile " + path,
                                 "FILE \"" + path + "\" WAVE\n  TRACK 01 AUDIO\n    INDEX 01 00:00:00\n",
                                 "[playlist]\nFile1=" + path,
                                 "<?xml version=\"1.0\"?><MPD/>",
                                 std::string(300'000, '\0'),
                                 "#EXTM3U\n#EXT-X-TARGETDURATION:1\n#EXTINF:1,\n" + path +
                                     "\n#EXT-X-ENDLIST\n"};
    for (const std::string& text : texts)
        for (const char* name : {"list.mp3", "list.wav", "list.m3u8"})
            EXPECT_EQ(refusal(fileURL(folder.write(name, text))), MediaErrorCode::notAudio) << text;
}

TEST_F(OpenerTest, KeepsTheFileOpen) {
    const auto path = encode("-c:a flac", "gone.flac");
    const auto asset = openFile(path);
    ASSERT_NE(asset, nullptr);
    std::filesystem::remove(path);
    FileReader reader(asset->file());
    const auto opened = sharedLoader().load()->open(reader, asset->info());
    ASSERT_NE(opened.decoder, nullptr);
    PcmBuffer buffer;
    EXPECT_EQ(opened.decoder->read(buffer, 1'000), Decoder::State::more);
    EXPECT_EQ(buffer.frames, 1'000u);
}

TEST_F(OpenerTest, AFileThatEndsTooEarlyFailsThere) {
    for (const char* name : {"cut.flac", "cut.m4a", "cut.mp3", "cut.aiff", "cut.wav"}) {
        const auto path = encode(name == std::string("cut.m4a") ? "-movflags faststart" : "", name);
        const auto asset = openFile(path);
        ASSERT_NE(asset, nullptr);
        std::filesystem::resize_file(path, std::filesystem::file_size(path) / 2);
        const auto [buffer, error] = playThrough(*asset);
        EXPECT_EQ(error.code, static_cast<std::int64_t>(MediaErrorCode::truncated)) << name;
        EXPECT_GT(buffer.frames, 30'000u) << name << ": what is there is played";
        EXPECT_LT(buffer.frames, 70'000u) << name;
    }
}

TEST_F(OpenerTest, AFileThatWasCutOffBeforeItIsOpenedKeepsItsPromisedLengthAndFailsThere) {
    for (const char* name : {"cut.flac", "cut.m4a", "cut.mp3", "cut.aiff", "cut.wav"}) {
        const auto path = encode(name == std::string("cut.m4a") ? "-movflags faststart" : "", name);
        std::filesystem::resize_file(path, std::filesystem::file_size(path) / 2);
        const auto asset = openFile(path);
        ASSERT_NE(asset, nullptr) << name;
        EXPECT_NEAR(asset->duration().seconds(), 100'003 / 44'100.0, 0.01) << name;
        const auto [buffer, error] = playThrough(*asset);
        EXPECT_EQ(error.code, static_cast<std::int64_t>(MediaErrorCode::truncated)) << name;
        EXPECT_GT(buffer.frames, 30'000u) << name << ": what is there is played";
        EXPECT_LT(buffer.frames, 70'000u) << name;
    }
}

TEST_F(OpenerTest, AWavFileWhoseWriterDidNotKnowItsLengthIsWhole) {
    std::string bytes = contentOf(folder / "source.wav");
    for (const std::string& size : {std::string("\xFF\xFF\xFF\xFF"), std::string("\0\xF0\xFF\x7F", 4)}) {
        bytes.replace(bytes.find("data") + 4, 4, size);
        const auto asset = openFile(folder.write("piped.wav", bytes));
        ASSERT_NE(asset, nullptr);
        EXPECT_EQ(asset->duration(), MediaTime(100'003, 44'100));
        const auto [buffer, error] = playThrough(*asset);
        EXPECT_EQ(error.code, 0);
        EXPECT_EQ(buffer.frames, 100'003u);
    }
}

TEST_F(OpenerTest, AFileThatCannotBeReadFailsWithItsReason) {
    const std::string bytes = contentOf(encode("-c:a flac", "faulty.flac"));
    FaultySource sound(bytes, bytes.size() * 2, EIO);
    const auto info = sharedLoader().load()->examine(sound).info;
    ASSERT_TRUE(info);
    for (const auto& [fault, code] :
         {std::pair(EIO, MediaErrorCode::cannotRead), {ETIMEDOUT, MediaErrorCode::timedOut}})
        for (const std::size_t part : {1u, 2u, 3u}) {
            FaultySource faulty(bytes, bytes.size() / 4 * part, fault);
            const auto opened = sharedLoader().load()->open(faulty, *info);
            Error error = opened.error;
            PcmBuffer buffer;
            while (opened.decoder && opened.decoder->read(buffer, 10'000) == Decoder::State::more) {
            }
            if (opened.decoder)
                error = opened.decoder->error();
            EXPECT_EQ(error.code, static_cast<std::int64_t>(code)) << part;
        }
}

TEST(DeadlineCall, LeavesACallBehindThatIsLate) {
    int pipe[2];
    ASSERT_EQ(::pipe(pipe), 0);
    const auto before = std::chrono::steady_clock::now();
    char byte = 0;
    auto read = std::make_shared<std::atomic<bool>>(false);
    EXPECT_FALSE(callUntil(before + 30ms, [end = pipe[0], read] {
        char answer = 0;
        *read = ::read(end, &answer, 1) == 1;
    }));
    EXPECT_LT(std::chrono::steady_clock::now() - before, 5s);
    EXPECT_EQ(::write(pipe[1], &byte, 1), 1);
    EXPECT_TRUE(callUntil(std::chrono::steady_clock::now() + 5s, [] {}));
    while (!*read)
        std::this_thread::yield();
    ::close(pipe[0]);
    ::close(pipe[1]);
}

} // namespace
} // namespace tarn
