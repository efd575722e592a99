#include "reply/Error.h"

#include <gmock/gmock.h>

#include <limits>

#include "localization/DirectoryLocalization.h"
#include "reply/LocalizedString.h"
#include "simulated/SimulatedLocalization.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

constexpr const char* bundlePath = "/errors.bundle";

std::string description(const Localization& localization, std::int64_t code) {
    return VLError::errorWithCode(localization, code).userInfo.at(localizedDescriptionKey);
}

TEST(AnError, KeepsItsCodeAndIsDescribedByItsKey) {
    const SimulatedLocalization localization;
    EXPECT_EQ(VLError::errorWithCode(localization, 25),
              (Error{"ostrel.pellion.errors",
                     25,
                     {{"LocalizedDescription", "VLErrorAudioPLaybackConnectionLostMessage"}}}));
    for (const auto& [code, text] :
         {std::pair(0, "VLErrorNoErrorMessage"), std::pair(16, "No first unlock yet."),
          std::pair(17, "Profile install  error."), std::pair(18, "Profile removal  error."),
          std::pair(24, "VLErrorAudioPlaybackErrorMessage"),
          std::pair(27, "VLErrorBuildAndRunNotificationFailedNoPermissionMessage")})
        EXPECT_EQ(description(localization, code), text);
    using Limits = std::numeric_limits<std::int64_t>;
    for (const std::int64_t unknown :
         std::initializer_list<std::int64_t>{1, 11, 26, 28, -1, Limits::min(), Limits::max()}) {
        EXPECT_EQ(VLError::errorWithCode(localization, unknown).code, unknown);
        EXPECT_EQ(description(localization, unknown), "VLErrorUnknownMessage") << unknown;
    }
}

TEST(AnError, MayHaveAReason) {
    const SimulatedLocalization localization;
    const Error bare = VLError::errorWithCode(localization, 24);
    EXPECT_EQ(VLError::errorWithCode(localization, 24, std::nullopt), bare);
    Error explained = VLError::errorWithCode(localization, 24, "no such file");
    EXPECT_EQ(explained.userInfo.extract("LocalizedFailureReason").mapped(), "no such file");
    EXPECT_EQ(explained, bare);
}

class ALocalizedString : public testing::Test {
protected:
    ALocalizedString() {
        localization.setTable(bundlePath, "en", {{{"key", "English"}, {"rare", "only English"}}});
        localization.setTable(bundlePath, "de", {{{"key", "Deutsch"}}});
        localization.setTable(bundlePath, "fr", std::nullopt);
    }

    std::string lookUp(const std::string& key) {
        return vlUtils_localizedStringForSystemLanguage(localization, key, bundlePath);
    }

    CapturedLog log;
    SimulatedLocalization localization;
};

TEST_F(ALocalizedString, IsInTheFirstLanguageThatHasIt) {
    localization.setPreferredLanguages({"de-AT", "en"});
    EXPECT_EQ(lookUp("key"), "Deutsch");
    EXPECT_EQ(lookUp("rare"), "only English");
    EXPECT_EQ(lookUp("none"), "none");
    localization.setPreferredLanguages({"sv", "de"});
    EXPECT_EQ(lookUp("key"), "Deutsch");
    localization.setPreferredLanguages({"fr", "sv"});
    EXPECT_EQ(lookUp("key"), "English") << "a table that cannot be read is as good as none";
    localization.setPreferredLanguages({});
    EXPECT_EQ(lookUp("key"), "English");
    EXPECT_EQ(lookUp(""), "");
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(ALocalizedString, IsTheKeyWithALineInTheLogWithoutABundle) {
    localization.addFile("/a file");
    EXPECT_EQ(vlUtils_localizedStringForSystemLanguage(localization, "key", "/a file"), "key");
    EXPECT_EQ(vlUtils_localizedStringForSystemLanguage(localization, "key", "/none"), "key");
    const std::string start =
        "vlUtils_localizedStringForSystemLanguage:155: Failed to localize key \"key\" in bundle at ";
    EXPECT_THAT(log.errors(),
                ElementsAre(start + "/a file. bundleExists=1", start + "/none. bundleExists=0"));
}

TEST(TheErrorBundle, DescribesEveryCodeInEveryLanguage) {
    const CapturedLog log;
    const std::string path = TARN_RESOURCES "/errors.bundle";
    const DirectoryLocalization english(path, {"en"});
    const auto languages = english.openBundle(path)->localizations();
    ASSERT_THAT(languages, ElementsAre("de", "en", "es", "fr", "it", "ja", "ko", "pt", "zh-Hans"));
    for (const std::string& language : languages) {
        const DirectoryLocalization localization(path, {language});
        for (std::int64_t code = 0; code < 28; ++code) {
            EXPECT_THAT(description(localization, code), Not(StartsWith("VLError"))) << language << code;
            EXPECT_EQ(description(localization, code) == description(english, code), language == "en")
                << language << code;
        }
    }
    EXPECT_THAT(log.lines(), IsEmpty());
}

} // namespace
} // namespace tarn
