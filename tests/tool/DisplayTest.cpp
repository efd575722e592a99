#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <clocale>
#include <cmath>

#include "client/tool/display/Columns.h"
#include "client/tool/display/Keys.h"
#include "client/tool/display/LiveLine.h"
#include "client/tool/display/TimeText.h"

namespace tarn::tool {
namespace {

using testing::HasSubstr;
using testing::Not;

TEST(TimeText, ShowsAndReadsTimes) {
    EXPECT_EQ(timeText(0), "0:00");
    EXPECT_EQ(timeText(187.9), "3:07");
    EXPECT_EQ(timeText(3'723), "1:02:03");
    EXPECT_EQ(timeText(NAN), "-:--");
    EXPECT_EQ(parseTime("83.5"), 83.5);
    EXPECT_EQ(parseTime("1:23.5"), 83.5);
    EXPECT_EQ(parseTime("1:02:03"), 3'723);
    for (const char* text : {"", ":", "1:60", "-1", "1:2:3:4", "1:", "x", "1 ", "inf", "nan"})
        EXPECT_EQ(parseTime(text), std::nullopt) << text;
}

TEST(LiveLine, FitsEveryWidthAndLeavesOutTheLeastImportantFirst) {
    std::setlocale(LC_CTYPE, "C.UTF-8");
    const LiveState state{"3/12", "A rather long title 音楽", "Somebody", 61, 120, false, 1.5F};
    for (int columns = 1; columns < 150; ++columns)
        EXPECT_LT(columnsOf(liveLine(state, columns, false)), std::max(columns, 2)) << columns;
    const auto wide = liveLine(state, 120, false);
    EXPECT_THAT(wide, HasSubstr("> 3/12 A rather long title 音楽 - Somebody 1:01 / 2:00 [=="));
    EXPECT_THAT(wide, HasSubstr("] 1.50x"));
    EXPECT_THAT(liveLine(state, 50, false), Not(HasSubstr("[")));
    EXPECT_THAT(liveLine(state, 40, false), Not(HasSubstr("Somebody")));
    EXPECT_THAT(liveLine(state, 40, false), HasSubstr("… 1:01 / 2:00 1.50x"));
    EXPECT_EQ(liveLine(state, 20, false), "> 1:01");
    EXPECT_THAT(liveLine(state, 120, true), HasSubstr("\x1b[1m"));
    EXPECT_THAT(wide, Not(HasSubstr("\x1b")));
}

TEST(FitColumns, NeverLetsATitleCommandTheTerminal) {
    std::setlocale(LC_CTYPE, "C.UTF-8");
    EXPECT_EQ(fitColumns("a\x1b[2Jb\n\xFF", 20), "a?[2Jb??");
    EXPECT_EQ(fitColumns("音楽", 3), "音…");
    EXPECT_EQ(fitColumns("音楽", 4), "音楽");
    EXPECT_EQ(fitColumns("abc", 1), "…");
}

TEST(Printable, IsOneLineThatCommandsNothingAndCutsNothing) {
    EXPECT_EQ(printable("a\x1b[2Jb\n\xFF\x7F\u009B c"), "a?[2Jb???? c");
    EXPECT_EQ(printable("音楽 é"), "音楽 é");
}

} // namespace
} // namespace tarn::tool
