#include <gmock/gmock.h>

#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using commands::destroyAsset;
using commands::upsertAsset;
using commands::upsertItem;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class AssetStoriesTest : public ClientStory {
protected:
    AssetStoriesTest() {
        device.media.addFile("file:///tagged.flac",
                             {.title = "Song", .albumTitle = "Album", .artist = "Band", .duration = 200s});
        device.media.addFile("file:///plain%20song.wav", {.duration = 2500ms});
        device.media.addFile("file:///private.wav", {.duration = 3s, .token = "token"});
    }
};

TEST_F(AssetStoriesTest, AnswersWithWhatTheFileTells) {
    EXPECT_EQ(tell(upsertAsset({.identifier = "a", .URL = "file:///tagged.flac"})),
              "upsertWithMetaData: albumTitle=Album artist=Band duration=200 identifier=a title=Song\n");
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("Decoded title for audio file asset: Song")));

    EXPECT_EQ(tell(upsertAsset({.identifier = "b", .URL = "file:///plain%20song.wav"})),
              "upsertWithMetaData: duration=2.5 identifier=b title=plain song.wav\n");
    EXPECT_THAT(log.messages().back(),
                HasSubstr("No metadata for title. Using file name for audio file asset: plain song.wav"));
}

TEST_F(AssetStoriesTest, WhatTheClientGivesComesBeforeWhatTheFileTells) {
    EXPECT_EQ(tell(upsertAsset({"a", "file:///tagged.flac", "Mine", "My album", "Me"})),
              "upsertWithMetaData: albumTitle=My album artist=Me duration=200 identifier=a title=Mine\n");
    // An empty title is given, an empty album or artist is not.
    EXPECT_EQ(tell(upsertAsset({"a", "file:///tagged.flac", "", "", ""})),
              "upsertWithMetaData: albumTitle=Album artist=Band duration=200 identifier=a\n");
}

TEST_F(AssetStoriesTest, TheFirstTagOfAKeyCountsAlsoWhenItHoldsNoText) {
    using Tag = MediaMetadataItem;
    device.media.addFile("file:///many.mp3",
                         {.firstTags = {Tag(Tag::commonKeyTitle, "other", "First"),
                                        Tag(Tag::commonKeyTitle, Tag::commonKeySpace, "Second"),
                                        Tag(Tag::commonKeyAlbumName, Tag::commonKeySpace, std::nullopt)},
                          .title = "Third",
                          .albumTitle = "Album",
                          .artist = "",
                          .duration = 1s});
    EXPECT_EQ(tell(upsertAsset({.identifier = "a", .URL = "file:///many.mp3"})),
              "upsertWithMetaData: duration=1 identifier=a title=Second\n");

    // The name of the file is for one that has no title at all.
    device.media.addFile(
        "file:///odd.mp3",
        {.firstTags = {Tag(Tag::commonKeyTitle, Tag::commonKeySpace, std::nullopt)}, .duration = 1s});
    EXPECT_EQ(tell(upsertAsset({.identifier = "a", .URL = "file:///odd.mp3"})),
              "upsertWithMetaData: duration=1 identifier=a\n");
}

TEST_F(AssetStoriesTest, AnUpsertWithAURLReplacesTheRecordWhole) {
    tell(upsertAsset({"a", "file:///tagged.flac", "Mine", "My album", "Me"}));
    auto before = client->assets->assetWithIdentifier("a");
    EXPECT_EQ(tell(upsertAsset({.identifier = "a", .URL = "file:///plain%20song.wav"})),
              "upsertWithMetaData: duration=2.5 identifier=a title=plain song.wav\n");
    EXPECT_NE(client->assets->assetWithIdentifier("a"), before);
    EXPECT_EQ(client->assets->vlAssetWithAsset(before.get()), nullptr);
}

TEST_F(AssetStoriesTest, AnUpdateWithoutAURLChangesOnlyWhatItGives) {
    tell(upsertAsset({.identifier = "a", .URL = "file:///tagged.flac"}));
    auto asset = client->assets->assetWithIdentifier("a");
    EXPECT_EQ(tell(upsertAsset({.identifier = "a", .title = "New", .albumTitle = ""})),
              "upsertWithMetaData: nothing\n");
    auto record = client->assets->vlAssetWithAsset(asset.get());
    ASSERT_TRUE(record);
    EXPECT_EQ(record->asset, asset);
    EXPECT_EQ(record->title, "New");
    EXPECT_EQ(record->albumTitle, "Album");
    EXPECT_EQ(record->artist, "Band");
    tell(upsertAsset({.identifier = "a", .artist = "Duo"}));
    record = client->assets->vlAssetWithAsset(asset.get());
    EXPECT_EQ(record->title, "New");
    EXPECT_EQ(record->artist, "Duo");

    EXPECT_EQ(tell(upsertAsset({.identifier = "unknown", .title = "New"})), "upsertWithMetaData: nothing\n");
    EXPECT_EQ(client->assets->assetWithIdentifier("unknown"), nullptr);
}

TEST_F(AssetStoriesTest, HoldsTheRightOfATokenOnlyWhileTheFileIsOpened) {
    device.sandboxExtensions.issue("token");
    auto upsert = [this](const char* URL, const char* token) {
        return tell(upsertAsset({.identifier = "a", .URL = URL, .sandboxExtensionToken = token}));
    };
    EXPECT_EQ(upsert("file:///private.wav", "token"),
              "upsertWithMetaData: duration=3 identifier=a title=private.wav\n");
    EXPECT_EQ(device.sandboxExtensions.held(), 0u);
    upsert("file:///tagged.flac", "");
    EXPECT_THAT(errors(), IsEmpty());

    EXPECT_EQ(upsert("file:///tagged.flac", "token"),
              "upsertWithMetaData: albumTitle=Album artist=Band duration=200 identifier=a title=Song\n");
    EXPECT_THAT(errors(), ElementsAre("Failed to consume asset sandox extension (Path: <private>). Playback "
                                      "will fail."));
}

TEST_F(AssetStoriesTest, AFileThatDoesNotOpenChangesNothing) {
    tell(upsertAsset({.identifier = "a", .URL = "file:///tagged.flac"}));
    auto before = client->assets->assetWithIdentifier("a");
    device.sandboxExtensions.issue("token");
    EXPECT_EQ(
        tell(upsertAsset({.identifier = "a", .URL = "file:///gone.flac", .sandboxExtensionToken = "token"})),
        "upsertWithMetaData: error 24 because: There is no such file.\n");
    EXPECT_EQ(client->assets->assetWithIdentifier("a"), before);
    EXPECT_EQ(device.sandboxExtensions.held(), 0u);
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("Could not open audio file asset")));
}

} // namespace
} // namespace tarn
