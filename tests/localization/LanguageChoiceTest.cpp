#include "localization/LanguageChoice.h"

#include <gmock/gmock.h>

#include <map>

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

const std::vector<std::string> shipped = {"de", "en", "es", "fr", "it", "ja", "ko", "pt", "zh-Hans"};

std::vector<std::string> languages(std::map<std::string, std::string> variables) {
    return languagesFromEnvironment([&](const char* name) { return variables[name]; });
}

TEST(ChoosingLocalizations, TakesTheLanguageInItsScript) {
    const auto choose = [](const std::string& preference) {
        return choosePreferredLocalizations(shipped, {preference});
    };
    EXPECT_THAT(choose("pt_BR"), ElementsAre("pt"));
    EXPECT_THAT(choose("DE-at"), ElementsAre("de"));
    for (const char* simplified : {"zh_CN", "zh", "zh-SG", "zh-Hans-HK", "zh_hans"})
        EXPECT_THAT(choose(simplified), ElementsAre("zh-Hans")) << simplified;
    for (const char* unsuited : {"zh_TW", "zh-Hant", "zh_HK", "sv", "", "-", "den", "d"})
        EXPECT_THAT(choose(unsuited), IsEmpty()) << unsuited;
}

TEST(ChoosingLocalizations, PutsTheBestFirst) {
    EXPECT_THAT(choosePreferredLocalizations({"pt-PT", "pt", "pt-BR", "zh-Hant"}, {"pt-BR", "zh_TW"}),
                ElementsAre("pt-BR", "pt", "pt-PT", "zh-Hant"));
    EXPECT_THAT(choosePreferredLocalizations(shipped, {"fr_CA", "sv", "ja_JP", "fr"}),
                ElementsAre("fr", "ja"));
    EXPECT_THAT(choosePreferredLocalizations({}, {"en"}), IsEmpty());
}

TEST(TheLanguagesOfTheEnvironment, AreThoseThatOtherProgramsRead) {
    EXPECT_THAT(languages({{"LANG", "de_AT.UTF-8"}}), ElementsAre("de-AT"));
    EXPECT_THAT(languages({{"LANG", "de_DE"}, {"LC_MESSAGES", "fr_FR@euro"}}), ElementsAre("fr-FR"));
    EXPECT_THAT(languages({{"LC_MESSAGES", "fr_FR"}, {"LC_ALL", "it_IT"}}), ElementsAre("it-IT"));
    EXPECT_THAT(languages({{"LANG", "de_DE"}, {"LANGUAGE", ":pt_BR::sv:pt_BR"}}), ElementsAre("pt-BR", "sv"));
    EXPECT_THAT(languages({{"LANG", "C.UTF-8"}, {"LANGUAGE", "ja:C:ko"}}), ElementsAre("ja"));
    EXPECT_THAT(languages({{"LANG", "sr_RS@latin"}}), ElementsAre("sr-Latn-RS"));
}

TEST(TheLanguagesOfTheEnvironment, AreNoneInTheLocaleOfNoLanguage) {
    EXPECT_THAT(languages({}), IsEmpty());
    EXPECT_THAT(languages({{"LANGUAGE", "de"}}), IsEmpty());
    EXPECT_THAT(languages({{"LANGUAGE", "de"}, {"LC_ALL", "C"}, {"LANG", "fr_FR"}}), IsEmpty());
    EXPECT_THAT(languages({{"LANG", "C.UTF-8"}}), IsEmpty());
    EXPECT_THAT(languages({{"LANG", "POSIX"}}), IsEmpty());
}

} // namespace
} // namespace tarn
