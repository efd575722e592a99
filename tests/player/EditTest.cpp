#include <gtest/gtest.h>

#include "tests/player/Listening.h"
#include "tests/support/CapturedLog.h"

namespace tarn {
namespace {

/// Edits of a queue that plays a, b and c, ten seconds each, with 100 ms on their way to the ear.
class Edit : public testing::Test {
protected:
    Edit() {
        test.platform.media.speaker().setLatency(100ms);
        test.play({a, b, c});
    }

    void advanceTo(std::chrono::nanoseconds time) {
        test.platform.scheduler.advance(time - test.platform.scheduler.now());
    }

    Listening test;
    const std::shared_ptr<MediaItem> a = test.item("a", 10s);
    const std::shared_ptr<MediaItem> b = test.item("b", 10s);
    const std::shared_ptr<MediaItem> c = test.item("c", 10s);
    const std::shared_ptr<MediaItem> x = test.item("x", 10s);
};

TEST_F(Edit, OfWhatComesNextLeavesWhatPlaysAlone) {
    advanceTo(9s); // b is rendered ahead
    test.reports();
    test.player->removeItem(b);
    test.player->insertItem(x, a);
    test.player->insertItem(b, nullptr);
    EXPECT_EQ(test.reports(), "9.000: x ready\n");
    advanceTo(45s);
    EXPECT_EQ(test.heard(), "0.000-10.000 a 0.000..10.000\n"
                            "10.000-20.000 x 0.000..10.000\n"
                            "20.000-30.000 c 0.000..10.000\n"
                            "30.000-40.000 b 0.000..10.000\n");
    EXPECT_EQ(test.platform.media.speaker().blends(), 0U);
}

TEST_F(Edit, OfTheCurrentItemActsAtOnce) {
    advanceTo(3s);
    test.reports();
    test.player->removeItem(a);
    EXPECT_EQ(a->currentTime().seconds(), 3.0) << "it stays where it was";
    EXPECT_EQ(b->currentTime().seconds(), 0.0);
    advanceTo(5s);
    test.player->advanceToNextItem();
    advanceTo(7s);
    test.player->replaceCurrentItem(x);
    advanceTo(8s);
    EXPECT_EQ(test.reports(), "3.000: current b\n"
                              "3.000: c ready\n"
                              "5.000: current c\n"
                              "7.000: current x\n"
                              "7.000: x ready\n");
    EXPECT_EQ(test.heard(), "0.000-3.100 a 0.000..3.100\n"
                            "3.100-5.100 b 0.000..2.000\n"
                            "5.100-7.100 c 0.000..2.000\n"
                            "7.100-8.000 x 0.000..0.900\n");
    EXPECT_EQ(test.platform.media.speaker().blends(), 3U);
}

TEST_F(Edit, ThatEmptiesTheQueueKeepsTheRate) {
    test.player->setRate(1.5F); // the first 100 ms are on their way at 1.0
    advanceTo(2s);
    test.reports();
    test.player->removeAllItems();
    EXPECT_EQ(test.player->currentItem(), nullptr);
    EXPECT_EQ(test.player->currentTime(), MediaTime::zero());
    test.settle();
    EXPECT_EQ(test.platform.media.speaker().soundingOutputs(), 0U) << "silent at once";
    advanceTo(60s);
    EXPECT_EQ(test.player->rate(), 1.5F);
    test.player->insertItem(x, nullptr);
    advanceTo(62s);
    EXPECT_EQ(x->currentTime().seconds(), 3.0);
    EXPECT_EQ(test.reports(), "2.000: current none\n60.000: current x\n60.000: x ready\n");
    EXPECT_EQ(test.heard(), "0.000-0.100 a 0.000..0.100\n"
                            "0.100-2.000 a 0.100..2.950\n"
                            "60.000-62.000 x 0.000..3.000\n");
}

TEST_F(Edit, ThatTakesAnItemOutAndBackGoesOnWhereItWas) {
    advanceTo(3s);
    test.player->removeItem(a);
    test.player->insertItem(a, nullptr);
    test.player->removeItem(b);
    test.player->removeItem(c);
    advanceTo(4s);
    EXPECT_EQ(test.nameOf(test.player->currentItem()), "a");
    EXPECT_NEAR(a->currentTime().seconds(), 3.9, 1e-9);
}

TEST_F(Edit, RefusesAnItemThatIsInTheQueueAlready) {
    CapturedLog log;
    test.player->insertItem(b, nullptr);
    test.player->replaceCurrentItem(c);
    EXPECT_EQ(log.errors().size(), 2U);
    test.player->replaceCurrentItem(a); // is what plays: nothing to do
    test.player->removeItem(x);         // is not there
    EXPECT_EQ(log.errors().size(), 2U);
    test.reports();
    advanceTo(40s);
    EXPECT_EQ(test.reports(), "10.000: a played to its end\n"
                              "10.000: current b\n"
                              "10.000: c ready\n"
                              "20.000: b played to its end\n"
                              "20.000: current c\n"
                              "30.000: c played to its end\n"
                              "30.000: current none\n"
                              "30.000: rate 0\n");
}

} // namespace
} // namespace tarn
