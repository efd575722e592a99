#include "controls/applications/DesktopApplicationRegistry.h"

#include <algorithm>

#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/stat.h>

#include "controls/applications/ApplicationFolders.h"
#include "system/FileDescriptor.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::Eq;
using testing::Optional;

constexpr const char* entryText = "[Desktop Entry]\nType=Application\nName=Player\n";

std::string addonText(const std::string& identifier, const std::string& extends) {
    return "<?xml version=\"1.0\"?><component type=\"addon\"><id> " + identifier + "\n</id><extends>" +
           extends + "</extends><description><p><id>other</id></p></description></component>";
}

class AnApplicationRegistry : public testing::Test {
protected:
    TemporaryFolder home;
    TemporaryFolder system;
    DesktopApplicationRegistry registry{{home.path(), system.path()}, {"de-AT", "fr"}};

    std::optional<std::string> containing(const std::string& extension) {
        return registry.applicationContainingExtension(extension);
    }
};

TEST_F(AnApplicationRegistry, FollowsTheMetadataOfAddons) {
    system.write("applications/org.example.Player.desktop", entryText);
    system.write("metainfo/watch.metainfo.xml", addonText("org.other.Watch", "org.example.Player.desktop"));
    system.write("metainfo/two.metainfo.xml",
                 addonText("org.other.Two", "org.example.Gone</extends><extends>org.example.Player"));
    system.write("metainfo/gone.metainfo.xml", addonText("org.other.Gone", "org.example.Gone.desktop"));
    EXPECT_THAT(containing("org.other.Watch"), Optional(Eq("org.example.Player")));
    EXPECT_THAT(containing("org.other.Two"), Optional(Eq("org.example.Player")));
    EXPECT_THAT(containing("org.other.Gone"), Optional(Eq("org.example.Gone")));
    EXPECT_EQ(containing("org.other"), std::nullopt);
    EXPECT_EQ(containing("other"), std::nullopt);
    EXPECT_EQ(containing(""), std::nullopt);
}

TEST_F(AnApplicationRegistry, FollowsWhatLaunchesAComponent) {
    system.write("applications/player.desktop", entryText);
    system.write("appdata/player.appdata.xml",
                 "<component type=\"desktop-application\"><id>org.example.Player</id>"
                 "<launchable type=\"desktop-id\">player.desktop</launchable></component>");
    system.write("metainfo/watch.metainfo.xml", addonText("org.other.Watch", "org.example.Player"));
    EXPECT_THAT(containing("org.other.Watch"), Optional(Eq("player")));
}

TEST_F(AnApplicationRegistry, PutsMetadataBeforeNamesAndTheUsersFolderFirst) {
    system.write("applications/org.example.Player.desktop", entryText);
    system.write("applications/org.example.Hidden.desktop", entryText);
    home.write("applications/org.example.Hidden.desktop", "[Desktop Entry]\nHidden=true\n");
    home.write("metainfo/a.metainfo.xml", addonText("org.example.Player.Watch", "org.example.Mine"));
    system.write("metainfo/a.metainfo.xml", addonText("org.example.Player.Watch", "org.example.Player"));
    EXPECT_THAT(containing("org.example.Player.Watch"), Optional(Eq("org.example.Mine")));
    EXPECT_EQ(containing("org.example.Hidden"), std::nullopt);
    EXPECT_EQ(containing("org.example.Hidden.Watch"), std::nullopt);
}

TEST_F(AnApplicationRegistry, NamesApplicationsInTheUsersLanguage) {
    system.write("applications/a.desktop",
                 "# comment\n[Desktop Entry]\nName[de]=Ab\\sspieler\\n\nName=Player\r\n"
                 "Type = Application\n[Desktop Action x]\nName=Other\n");
    system.write("applications/b.desktop",
                 "[Desktop Entry]\nType=Application\nName[sv]=Spelare\nName=Player\n");
    system.write("applications/c.desktop", "[Desktop Entry]\nType=Application\nName=\xFF\n");
    EXPECT_THAT(registry.applicationName("a"), Optional(Eq("Ab spieler\n")));
    EXPECT_THAT(registry.applicationName("b"), Optional(Eq("Player")));
    EXPECT_EQ(registry.applicationName("c"), std::nullopt);
    EXPECT_EQ(registry.applicationName("d"), std::nullopt);
}

TEST_F(AnApplicationRegistry, SeesEveryChangeOfItsFolders) {
    EXPECT_EQ(containing("org.example.A"), std::nullopt);
    system.write("applications/org.example.A.desktop", entryText);
    EXPECT_THAT(containing("org.example.A"), Optional(Eq("org.example.A")));
    system.write("applications/org.example.B.desktop", entryText);
    EXPECT_THAT(containing("org.example.B"), Optional(Eq("org.example.B")));
    fs::remove(system / "applications/org.example.A.desktop");
    EXPECT_EQ(containing("org.example.A"), std::nullopt);
    home.write("metainfo/a.metainfo.xml", addonText("org.example.A", "org.example.B"));
    EXPECT_THAT(containing("org.example.A"), Optional(Eq("org.example.B")));
}

TEST_F(AnApplicationRegistry, SeesWhatIsWrittenOverInPlace) {
    const std::string other = "[Desktop Entry]\nType=Application\nName=Other\n";
    system.write("applications/org.example.A.desktop", entryText);
    const fs::path target = system.write("elsewhere/b.desktop", entryText);
    fs::create_symlink(target, system / "applications/org.example.B.desktop");
    system.write("metainfo/watch.metainfo.xml", addonText("org.other.Watch", "org.example.A"));
    for (const char* name : {"org.example.A", "org.example.B"})
        EXPECT_THAT(registry.applicationName(name), Optional(Eq("Player"))) << name;

    system.write("applications/org.example.A.desktop", other);
    EXPECT_THAT(registry.applicationName("org.example.A"), Optional(Eq("Other")));
    system.write("elsewhere/b.desktop", other);
    EXPECT_THAT(registry.applicationName("org.example.B"), Optional(Eq("Other")));
    EXPECT_THAT(containing("org.other.Watch"), Optional(Eq("org.example.A")));
    system.write("metainfo/watch.metainfo.xml", addonText("org.other.Watch", "org.example.B"));
    EXPECT_THAT(containing("org.other.Watch"), Optional(Eq("org.example.B")));
}

TEST_F(AnApplicationRegistry, LosesOnlyHostileEntriesThemselves) {
    system.write("applications/org.example.Good.desktop", entryText);
    system.write("applications/org.example.Garbage.desktop", std::string("\0[Desktop Entry]\xFF=\n=", 20));
    system.write("applications/org.example.Link.desktop", "[Desktop Entry]\nType=Link\nName=x\n");
    system.write("applications/org.example.Big.desktop", entryText + std::string(1 << 20, '#'));
    fs::create_directory(system / "applications/org.example.Folder.desktop");
    fs::create_directory_symlink(system.path(), system / "applications/loop");
    fs::create_symlink("nowhere", system / "applications/org.example.Dangling.desktop");
    ASSERT_EQ(mkfifo((system / "applications/org.example.Fifo.desktop").c_str(), 0600), 0);
    system.write("metainfo/1.metainfo.xml",
                 "<component type=\"addon\"><id>org.other.Cut</id><extends>org.example");
    system.write("metainfo/2.metainfo.xml",
                 "<!DOCTYPE c [<!ENTITY a \"org.example.Good\">]>" + addonText("org.other.Entity", "&a;"));
    system.write("metainfo/3.metainfo.xml", addonText("", "org.example.Good"));
    std::string deep;
    for (int depth = 0; depth < 100'000; ++depth)
        deep += "<a>";
    system.write("metainfo/4.metainfo.xml", deep);
    system.write("metainfo/5.metainfo.xml", addonText("org.other.Good", "org.example.Good"));

    EXPECT_THAT(containing("org.other.Good"), Optional(Eq("org.example.Good")));
    for (const char* hostile :
         {"org.example.Garbage", "org.example.Link", "org.example.Big", "org.example.Folder",
          "org.example.Dangling", "org.example.Fifo", "org.other.Cut", "org.other.Entity"})
        EXPECT_EQ(containing(hostile), std::nullopt) << hostile;
}

TEST_F(AnApplicationRegistry, FallsBackToNames) {
    system.write("applications/org.example.Player.desktop", entryText);
    system.write("applications/org.desktop", entryText);
    system.write("applications/vendor/tools/alone.desktop", entryText);
    EXPECT_THAT(containing("org.example.Player"), Optional(Eq("org.example.Player")));
    EXPECT_THAT(containing("org.example.Player.Watch.Small"), Optional(Eq("org.example.Player")));
    EXPECT_THAT(containing("vendor-tools-alone"), Optional(Eq("vendor-tools-alone")));
    EXPECT_EQ(containing("org.example"), std::nullopt);
    EXPECT_EQ(containing("../org.example.Player"), std::nullopt);
}

} // namespace
} // namespace tarn
