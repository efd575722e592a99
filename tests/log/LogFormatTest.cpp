#include <gmock/gmock.h>

#include "log/LogFormat.h"
#include "tests/support/CapturedLog.h"
#include "wire/Utf8.h"

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::EndsWith;

constexpr const char* method = "-[Player play]";

std::string format(std::string_view text, std::initializer_list<LogArgument> arguments = {}) {
    return formatLogMessage(method, 12, "%{public}s:%d: " + std::string(text), arguments).substr(19);
}

TEST(LogFormat, HidesTextThatIsNotMarkedPublic) {
    EXPECT_EQ(format("a=%@ b=%s c=%{public}@ d=%{private}d e=%d", {"one", "two", "three", 4, 5}),
              "a=<private> b=<private> c=three d=<private> e=5");
    EXPECT_EQ(format("%@", {std::optional<std::string>("name")}), "<private>");
}

TEST(LogFormat, WritesEachKindOfValue) {
    EXPECT_EQ(format("%p", {reinterpret_cast<const void*>(0xbeef)}), "0xbeef");
    EXPECT_EQ(format("%d %lld %x", {-1, std::int64_t{1} << 40, 255}), "-1 1099511627776 ff");
    EXPECT_EQ(format("%.2f %f %g", {1.005, 2.0, 0.5}), "1.00 2.000000 0.5");
    EXPECT_EQ(format("%d %d", {true, false}), "1 0");
    const std::vector<std::optional<std::string>> absent(1);
    EXPECT_EQ(format("%{public}@ %{public}s", {absent.front(), static_cast<const char*>(nullptr)}),
              "(null) (null)");
    EXPECT_EQ(format("%.400f", {1e308}).find_first_not_of("0123456789."), std::string::npos);
}

TEST(LogFormat, SurvivesAFormatThatDoesNotMatchItsArguments) {
    EXPECT_EQ(format("100%% %d %{public}@", {1}), "100% 1 <missing>");
    EXPECT_EQ(format("end %", {1}), "end 1");
    EXPECT_EQ(format("%{public", {1}), "1");
    EXPECT_EQ(format("%.99999999999f", {0.5}), "0.500000");
    EXPECT_EQ(format("nothing", {1, 2}), "nothing");
}

TEST(LogFormat, KeepsOneRecordOnOneLine) {
    using namespace std::string_literals;
    EXPECT_EQ(format("%{public}@", {"a\nb\r\tc\0d\x1b[31m"s}), "a\\nb\\r\\tc\\u{0}d\\u{1b}[31m");
    const std::string separators = "\xE2\x80\xA8|\xC2\x85|";
    const std::string reversal = "\xE2\x80" + "\xAE"s;
    EXPECT_EQ(format("%{public}@", {std::string(separators + reversal)}), "\\u{2028}|\\u{85}|\\u{202e}");
    EXPECT_EQ(format("%{public}@", {"\xFFok\xC3"}), "\xEF\xBF\xBDok\xEF\xBF\xBD");
    EXPECT_EQ(format("%{public}@", {"%d %s \xF0\x9F\x8E\xB5"}), "%d %s \xF0\x9F\x8E\xB5");
}

TEST(LogFormat, BoundsTextsAndLines) {
    const std::string fits(logTextLimit, 'x');
    EXPECT_EQ(format("%{public}@", {fits}), fits);
    EXPECT_EQ(format("%{public}@|", {fits + "x"}), fits.substr(3) + "...|");

    std::string notes;
    for (int count = 0; count < 100'000; ++count)
        notes += "\xF0\x9F\x8E\xB5";
    const std::string line = format("%{public}@%{public}@%{public}@%{public}@", {notes, notes, notes, notes});
    EXPECT_LE(line.size(), logMessageLimit);
    EXPECT_GT(line.size(), logMessageLimit - 50);
    EXPECT_THAT(line, EndsWith("..."));
    EXPECT_TRUE(isValidUtf8(line));
}

TEST(Utf8, KnowsWellFormedCharacters) {
    for (const char* good : {"", "plain", "\xC2\x80", "\xE0\xA0\x80", "\xED\x9F\xBF", "\xEF\xBF\xBF",
                             "\xF0\x90\x80\x80", "\xF4\x8F\xBF\xBF"})
        EXPECT_TRUE(isValidUtf8(good)) << good;
    for (const char* bad :
         {"\x80", "\xC0\xAF", "\xC1\xBF", "\xE0\x9F\xBF", "\xED\xA0\x80", "\xF0\x8F\xBF\xBF",
          "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xFF", "a\xC3", "\xE2\x82", "\xE2\x82\x28"})
        EXPECT_FALSE(isValidUtf8(bad)) << testing::PrintToString(bad);
}

} // namespace
} // namespace tarn
