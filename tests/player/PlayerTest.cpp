#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <limits>

#include "tests/player/Listening.h"
#include "tests/support/CapturedLog.h"

namespace tarn {
namespace {

/// What plays by itself.
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

TEST(Player, OpensTheCurrentItemAndTheNextOneOnly) {
    Listening test;
    auto a = test.item("a"), b = test.item("b"), c = test.item("c");
    EXPECT_EQ(a->status(), MediaStatus::unknown);
    test.play({a, b, c}, 0);
    EXPECT_EQ(a->status(), MediaStatus::readyToPlay);
    EXPECT_EQ(b->status(), MediaStatus::readyToPlay);
    EXPECT_EQ(c->status(), MediaStatus::unknown);
    EXPECT_EQ(test.platform.media.speaker().outputs(), 0U) << "nothing was to sound yet";
}

/// A pause of `player` holds the position, the sound and every timer.
TEST(Player, StandsStillWhilePaused) {
    Listening test;
    auto a = test.item("a", 10s);
    test.play({a, test.item("b", 10s)});
    test.advance(3500ms);
    test.player->pause();
    EXPECT_EQ(a->currentTime().seconds(), 3.5);
    test.settle();
    EXPECT_EQ(test.platform.media.speaker().soundingOutputs(), 0U);
    auto paused = test.platform.scheduler.now();
    test.platform.scheduler.runUntilIdle();
    EXPECT_EQ(test.platform.scheduler.now(), paused) << "something was going to wake up";
    test.advance(1h);
    EXPECT_EQ(a->currentTime().seconds(), 3.5);
    test.player->play();
    test.advance(1s);
    EXPECT_EQ(a->currentTime().seconds(), 4.5);
    EXPECT_EQ(test.heard(), "0.000-3.500 a 0.000..3.500\n"
                            "3603.500-3604.500 a 3.500..4.500\n");
}

// Rates.

class PlayerRates : public testing::TestWithParam<std::chrono::nanoseconds> {};

TEST_P(PlayerRates, ChangeWithoutLosingAnything) {
    Listening test;
    test.platform.media.speaker().setLatency(GetParam());
    auto a = test.item("a", 60s);
    test.play({a});
    double latency = std::chrono::duration<double>(GetParam()).count();
    double position = 0;
    double before = 1;
    for (double rate : {1.0, 2.0, 0.5, 1.5, -1.0, -3.0, 0.25, 1.0}) {
        test.player->setRate(static_cast<float>(rate));
        EXPECT_EQ(test.player->rate(), static_cast<float>(rate));
        EXPECT_NEAR(a->currentTime().seconds(), position, 1e-6);
        test.advance(2s); // what cannot be taken back is heard at the rate before
        position += latency * before + (2 - latency) * rate;
        EXPECT_NEAR(a->currentTime().seconds(), position, 1e-5) << "at rate " << rate;
        before = rate;
    }
    auto heard = test.platform.media.speaker().heard();
    ASSERT_EQ(heard.size(), 8U);
    for (std::size_t i = 1; i < heard.size(); ++i) {
        EXPECT_EQ(heard[i].from, heard[i - 1].to);
        EXPECT_LE(std::abs((heard[i].start - heard[i - 1].end).count()), 1) << heard[i].text();
    }
}

INSTANTIATE_TEST_SUITE_P(Latencies, PlayerRates, testing::Values(0ms, 40ms, 300ms));

TEST(Player, StopsAtTheStartWhenPlayingBackwards) {
    Listening test;
    auto a = test.item("a", 10s);
    a->seekToTime({4, 1});
    test.play({a, test.item("b", 10s)}, -2);
    test.advance(1s);
    EXPECT_EQ(a->currentTime().seconds(), 2.0);
    test.advance(10s);
    EXPECT_EQ(test.heard(), "0.000-2.000 a 4.000..0.000\n");
    EXPECT_EQ(test.reports(), "0.000: rate -2\n2.000: rate 0\n");
    EXPECT_EQ(a->currentTime().seconds(), 0.0);
    test.player->setRate(-1);
    EXPECT_EQ(test.reports(), "11.000: rate -1\n11.000: rate 0\n");
    test.player->play();
    test.advance(3s);
    EXPECT_EQ(a->currentTime().seconds(), 3.0);
}

TEST(Player, TurnsBackOverTheJoinOfTwoItems) {
    Listening test;
    test.platform.media.speaker().setLatency(50ms);
    auto b = test.item("b", 10s);
    test.play({test.item("a", 2s), b});
    test.advance(1980ms);
    test.player->setRate(-1); // the first 30 ms of b are on their way
    test.advance(1s);
    EXPECT_EQ(test.heard(), "0.000-2.000 a 0.000..2.000\n"
                            "2.000-2.030 b 0.000..0.030\n"
                            "2.030-2.060 b 0.030..0.000\n");
    EXPECT_EQ(test.nameOf(test.player->currentItem()), "b");
    EXPECT_EQ(test.player->rate(), 0.0F);
}

TEST(Player, TakesEveryFiniteRate) {
    CapturedLog log;
    Listening test;
    auto a = test.item("a", 10s);
    a->seekToTime({5, 1});
    test.play({a}, 0.75F);
    for (float rate : {std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity(),
                       -std::numeric_limits<float>::infinity()}) {
        std::size_t lines = log.errors().size();
        test.player->setRate(rate);
        EXPECT_EQ(test.player->rate(), 0.75F);
        EXPECT_EQ(log.errors().size(), lines + 1);
    }
    for (float rate : {std::numeric_limits<float>::denorm_min(), 1e-30F, -1e-30F}) {
        test.player->setRate(rate);
        test.advance(10s);
        EXPECT_EQ(test.player->rate(), rate);
        EXPECT_EQ(a->currentTime().seconds(), 5.0);
    }
    test.player->setRate(std::numeric_limits<float>::max());
    test.advance(1ms);
    EXPECT_EQ(test.player->currentItem(), nullptr);
    EXPECT_EQ(test.player->rate(), 0.0F);
}

// Positions.

TEST(Player, SeeksWhilePlaying) {
    Listening test;
    test.platform.media.speaker().setLatency(100ms);
    auto a = test.item("a", 60s);
    test.play({a, test.item("b", 10s)});
    test.advance(5s);
    test.reports();
    a->seekToTime({1800, 60});
    EXPECT_EQ(a->currentTime().seconds(), 30.0) << "is to be read back at once";
    EXPECT_EQ(test.reports(), "5.000: a jumped\n");
    test.advance(50ms);
    EXPECT_EQ(a->currentTime().seconds(), 30.0) << "the frames on their way do not count";
    test.advance(1050ms);
    EXPECT_EQ(a->currentTime().seconds(), 31.0);
    a->seekToTime({59, 1});
    test.advance(3s);
    EXPECT_EQ(test.heard(), "0.000-5.100 a 0.000..5.100\n"
                            "5.100-6.200 a 30.000..31.100\n"
                            "6.200-7.200 a 59.000..60.000\n"
                            "7.200-9.100 b 0.000..1.900\n");
}

TEST(Player, SeeksBeforePlaying) {
    Listening test;
    auto a = test.item("a", 60s), b = test.item("b", 10s), c = test.item("c", 10s),
         other = test.item("other", 10s);
    test.play({a, b, c}, 0);
    a->seekToTime({58, 1});
    b->seekToTime({9, 1});
    c->seekToTime({8, 1});
    other->seekToTime({7, 1});
    for (const auto& [item, position] : {std::pair(a, 58.0), {b, 9.0}, {c, 8.0}, {other, 7.0}})
        EXPECT_EQ(item->currentTime().seconds(), position);
    EXPECT_EQ(test.reports(), "0.000: a jumped\n0.000: b jumped\n0.000: c jumped\n0.000: other jumped\n");
    test.player->play();
    test.advance(1500ms);
    b->seekToTime({5, 1}); // it is rendered already
    EXPECT_EQ(b->currentTime().seconds(), 5.0);
    test.advance(7500ms);
    EXPECT_EQ(test.heard(), "0.000-2.000 a 58.000..60.000\n"
                            "2.000-7.000 b 5.000..10.000\n"
                            "7.000-9.000 c 8.000..10.000\n");
}

TEST(Player, TakesASeekIntoTheItem) {
    CapturedLog log;
    Listening test;
    auto a = test.item("a", 10s);
    MediaScript script;
    script.tellsDuration = false;
    auto untold = test.item("untold", script);
    test.play({a, untold}, 0);
    a->seekToTime({-5, 1});
    EXPECT_EQ(a->currentTime().seconds(), 0.0);
    a->seekToTime(MediaTime::fromSeconds(1e300, 60));
    EXPECT_EQ(a->currentTime().seconds(), 10.0);
    EXPECT_EQ(test.reports(), "0.000: a jumped\n0.000: a jumped\n");
    EXPECT_TRUE(log.errors().empty());
    a->seekToTime(MediaTime::fromSeconds(std::numeric_limits<double>::quiet_NaN(), 60));
    EXPECT_EQ(a->currentTime().seconds(), 10.0);
    EXPECT_EQ(log.errors().size(), 1U);
    EXPECT_EQ(test.reports(), "");
    untold->seekToTime(MediaTime::fromSeconds(1e300, 60));
    test.player->play();
    test.advance(1ms); // both stand at their ends
    EXPECT_EQ(test.reports(), "0.000: untold jumped\n"
                              "0.000: rate 1\n"
                              "0.000: a played to its end\n"
                              "0.000: current untold\n"
                              "0.000: untold played to its end\n"
                              "0.000: current none\n"
                              "0.000: rate 0\n");
}

} // namespace
} // namespace tarn
