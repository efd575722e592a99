#include "localization/StringsFile.h"

#include <gmock/gmock.h>
#include <sys/stat.h>

#include "localization/DirectoryBundle.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

using namespace std::string_literals;
using testing::ElementsAre;
using testing::Optional;
using testing::Pair;

TEST(AStringsFile, HoldsQuotedAndPlainEntriesAndComments) {
    EXPECT_THAT(parseStringsFile("/* a \"b\" = c; // */ \"key\" = \"text\"; // rest = \"of line\";\n"
                                 "plain.key-1=word;'single' = 'a \"b\"';\r\n\"alone\";\"key\"=\"later\";"),
                Optional(ElementsAre(Pair("alone", "alone"), Pair("key", "later"),
                                     Pair("plain.key-1", "word"), Pair("single", "a \"b\""))));
    EXPECT_THAT(parseStringsFile(" /**/ "), Optional(ElementsAre()));
    EXPECT_THAT(parseStringsFile("a = \"line 1\nline 2\";"),
                Optional(ElementsAre(Pair("a", "line 1\nline 2"))));
}

TEST(AStringsFile, HoldsEscapes) {
    EXPECT_THAT(parseStringsFile(R"("a" = "\"\'\\\n\t\q\101\7";)"),
                Optional(ElementsAre(Pair("a", "\"'\\\n\tqA\a"))));
    EXPECT_THAT(parseStringsFile(R"("a" = "\U00e9\u20AC\UD83C\UDFB5\U41";)"),
                Optional(ElementsAre(Pair("a", "\u00e9\u20AC\U0001F3B5A"))));
}

TEST(AStringsFile, MayBeUtf16OrBeginWithAMark) {
    EXPECT_THAT(parseStringsFile("\xFF\xFE"s + "a\0=\0\"\0\xE9\0\"\0;\0"s),
                Optional(ElementsAre(Pair("a", "\u00e9"))));
    EXPECT_THAT(parseStringsFile("\xFE\xFF"s + "\0a\0=\0\"\xD8\x3C\xDF\xB5\0\"\0;"s),
                Optional(ElementsAre(Pair("a", "\U0001F3B5"))));
    EXPECT_THAT(parseStringsFile("\xEF\xBB\xBF" + "a=b;"s), Optional(ElementsAre(Pair("a", "b"))));
}

TEST(AStringsFile, IsUnreadableWhenAnyOfItIsBroken) {
    for (const std::string& broken :
         {"\"a\" = \"b\""s, "\"a\" \"b\";"s, "\"a\" = ;"s, "= \"b\";"s, "\"a = \"b\";"s, "/* open"s,
          "\"a\" = \"b\\"s, "\"a\" = \"\\U\";"s, "\"a\" = \"\\UD83C\";"s, "\"a\" = \"\\UD83Cx\\UDFB5\";"s,
          "\"a\" = \"\\UDFB5\";"s, "a = {b = c;};"s, "a = b; \0"s, "a = \"\xFF\";"s, "\xFF\xFE"s + "a"s,
          "\xFE\xFF\xD8\x3C"s, "bplist00\xD0\x08"s})
        EXPECT_FALSE(parseStringsFile(broken)) << testing::PrintToString(broken);
}

TEST(AStringsFile, IsReadFromRegularFilesOfBoundedSizeOnly) {
    const TemporaryFolder folder;
    EXPECT_TRUE(readStringsFileAt(folder.write("good", "a=b;")));
    EXPECT_FALSE(readStringsFileAt(folder.write("big", std::string((1 << 20) + 1, ' '))));
    EXPECT_FALSE(readStringsFileAt(folder / "missing"));
    EXPECT_FALSE(readStringsFileAt(folder.path()));
    const std::string fifo = folder / "fifo";
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    EXPECT_FALSE(readStringsFileAt(fifo));
}

} // namespace
} // namespace tarn
