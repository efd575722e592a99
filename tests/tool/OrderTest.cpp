#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <clocale>
#include <string>
#include <vector>

#include "client/tool/lists/NaturalOrder.h"
#include "client/tool/play/PlayOrder.h"
#include "client/tool/remote/Adjustment.h"

namespace tarn::tool {
namespace {

using testing::ElementsAre;
using testing::UnorderedElementsAre;

TEST(NaturalOrder, CountsAsPeopleDo) {
    std::setlocale(LC_CTYPE, "C.UTF-8");
    const std::vector<std::string> sorted = {"01",
                                             "1",
                                             "1 b",
                                             "2",
                                             "10",
                                             "18446744073709551616",
                                             "18446744073709551617",
                                             "a1 b10",
                                             "A2",
                                             "a10",
                                             "a10 b",
                                             "a10.1",
                                             "Cd 10",
                                             "cd 100",
                                             "\xC4 is no text",
                                             "äpfel",
                                             "Äpfel2"};
    auto names = sorted;
    std::reverse(names.begin(), names.end());
    std::sort(names.begin(), names.end(), comesBefore);
    EXPECT_EQ(names, sorted);
}

std::vector<std::size_t> take(PlayOrder& order, int count) {
    std::vector<std::size_t> files;
    for (int i = 0; i < count; ++i)
        if (const auto turn = order.next())
            files.push_back(turn->file);
    return files;
}

TEST(PlayOrder, GivesEveryFileItsTurnInEveryRound) {
    PlayOrder once(3, {});
    EXPECT_THAT(take(once, 5), ElementsAre(0, 1, 2));

    PlayOrder shuffled(4, {.isShuffled = true, .isLooped = true}, 1);
    std::size_t last = 4;
    for (int round = 0; round < 100; ++round) {
        const auto files = take(shuffled, 4);
        EXPECT_THAT(files, UnorderedElementsAre(0, 1, 2, 3));
        EXPECT_NE(files.front(), last);
        last = files.back();
    }
}

TEST(PlayOrder, EndsALoopThatHasNothingLeftToPlay) {
    PlayOrder order(2, {.isShuffled = false, .isLooped = true});
    order.leaveOut(0);
    EXPECT_THAT(take(order, 3), ElementsAre(1, 1, 1));
    EXPECT_EQ(order.next()->number, 2U);
    order.leaveOut(1);
    EXPECT_FALSE(order.next());
}

TEST(Adjustments, AreWhereToOrHowFar) {
    const auto time = [](const char* text) {
        return parseTimeAdjustment(text).value_or(Adjustment{}).appliedTo(100);
    };
    EXPECT_EQ(time("1:30"), 90);
    EXPECT_EQ(time("+1:30"), 190);
    EXPECT_EQ(time("-10.5"), 89.5);
    EXPECT_EQ(parseAdjustment("80%")->appliedTo(50), 80);
    EXPECT_EQ(parseAdjustment("-5")->appliedTo(50), 45);
    for (const char* text : {"", "+", "+-1", "x", "1x", "nan", "1 "}) {
        EXPECT_FALSE(parseTimeAdjustment(text)) << text;
        EXPECT_FALSE(parseAdjustment(text)) << text;
    }
}

} // namespace
} // namespace tarn::tool
