#include <gtest/gtest.h>

#include "objects/FileName.h"

namespace tarn {
namespace {

TEST(FileNameTest, IsTheLastPathComponentAsAPersonWouldWriteIt) {
    struct Case {
        const char* URL;
        const char* name;
    };
    for (const Case& known : {
             Case{"file:///music/song.flac", "song.flac"},
             Case{"file:///music/a%20song%2Fb.mp3", "a song/b.mp3"},
             Case{"file:///music/K%C3%A4se.ogg", "K\u00e4se.ogg"},
             Case{"file:///music/album/", "album"},
             Case{"file://host/song.wav?query/x#part/y", "song.wav"},
             Case{"song.m4a", "song.m4a"},
             Case{"file:song.m4a", "song.m4a"},
             Case{"a/b:c", "b:c"},
             // What is not an encoding of text stays as it stands.
             Case{"file:///100%.mp3", "100%.mp3"},
             Case{"file:///%zz.mp3", "%zz.mp3"},
             Case{"file:///%ff.mp3", "%ff.mp3"},
             Case{"file:///a%00b.mp3", "a%00b.mp3"},
             Case{"file:///%4", "%4"},
             Case{"file:///", ""},
             Case{"file://host", ""},
             Case{"", ""},
         })
        EXPECT_EQ(fileNameOfURL(known.URL), known.name) << known.URL;
}

} // namespace
} // namespace tarn
