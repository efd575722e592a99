#include <sys/stat.h>

#include <fstream>

#include "media/FileURL.h"
#include "tests/support/MediaFixture.h"

namespace tarn {
namespace {

struct OpenerTest : testing::Test, FilesOfTheService {
    MediaErrorCode refusal(const std::string& URL) {
        MediaAssetOutcome outcome = openURL(URL);
        EXPECT_EQ(outcome.asset, nullptr) << URL;
        EXPECT_EQ(outcome.error.domain, mediaErrorDomain) << URL;
        EXPECT_FALSE(outcome.error.userInfo[localizedDescriptionKey].empty()) << URL;
        return static_cast<MediaErrorCode>(outcome.error.code);
    }

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

TEST_F(OpenerTest, TellsWhatTheFileSaysOfItself) {
    const auto asset = openFile(encode("-metadata title='Caf\xC3\xA9' -metadata artist=Someone", "a.flac"));
    ASSERT_NE(asset, nullptr);
    EXPECT_EQ(asset->duration(), MediaTime(100'003, 44'100));
    ASSERT_EQ(asset->commonMetadata().size(), 2u);
    EXPECT_EQ(asset->commonMetadata()[0].key(), MediaMetadataItem::commonKeyTitle);
    EXPECT_EQ(asset->commonMetadata()[0].stringValue(), "Caf\xC3\xA9");
    EXPECT_EQ(asset->commonMetadata()[1].key(), MediaMetadataItem::commonKeyArtist);
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

} // namespace
} // namespace tarn
