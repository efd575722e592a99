#include <gtest/gtest.h>

#include "tests/media/Listening.h"

namespace tarn {
namespace {

TEST(Player, PlaysOneItemAfterTheOtherWithoutAGap) {
    Listening test;
    test.play({test.item("a", 10s), test.item("b", 2500ms), test.item("c", 4s)});
    test.advance(1min);
    EXPECT_EQ(test.heard(), "0.000-10.000 a 0.000..10.000\n"
                            "10.000-12.500 b 0.000..2.500\n"
                            "12.500-16.500 c 0.000..4.000\n");
    EXPECT_EQ(test.reports(), "0.000: rate 1\n"
                              "10.000: a played to its end\n"
                              "10.000: current b\n"
                              "10.000: c ready\n"
                              "12.500: b played to its end\n"
                              "12.500: current c\n"
                              "16.500: c played to its end\n"
                              "16.500: current none\n"
                              "16.500: rate 0\n");
    EXPECT_EQ(test.platform.media.speaker().soundingOutputs(), 0U);
}

} // namespace
} // namespace tarn
