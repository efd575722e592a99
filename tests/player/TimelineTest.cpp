#include <gtest/gtest.h>

#include "player/Timeline.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

/// Entry 1 at twice its speed, then entry 2 at its own, a frame a millisecond; entry 1 begins at frame 100.
Timeline twoEntries() {
    Timeline timeline;
    timeline.append({.entry = 1, .firstFrame = 100, .endFrame = 200, .start = 1s, .end = 1200ms});
    timeline.append({.entry = 1,
                     .firstFrame = 200,
                     .endFrame = 300,
                     .start = 1200ms,
                     .end = 1400ms,
                     .ending = Timeline::End::completed});
    timeline.append({.entry = 2, .firstFrame = 300, .endFrame = 400, .start = 0s, .end = 100ms});
    return timeline;
}

TEST(Timeline, KnowsWhereEveryEntryIs) {
    Timeline timeline = twoEntries();
    EXPECT_EQ(timeline.positionOf(1, 0), 1s);
    EXPECT_EQ(timeline.positionOf(1, 101), 1002ms);
    EXPECT_EQ(timeline.positionOf(1, 200), 1200ms);
    EXPECT_EQ(timeline.positionOf(1, 299), 1398ms);
    EXPECT_EQ(timeline.positionOf(1, 1000), 1400ms);
    EXPECT_EQ(timeline.positionOf(2, 299), 0s);
    EXPECT_EQ(timeline.positionOf(2, 350), 50ms);
    EXPECT_EQ(timeline.positionOf(3, 350), std::nullopt);
    EXPECT_EQ(timeline.endOf(1)->endFrame, 300);
    EXPECT_EQ(timeline.endOf(2), nullptr);
}

TEST(Timeline, CutsAtTheFrame) {
    Timeline timeline = twoEntries();
    timeline.cut(300); // the entry before goes on instead
    EXPECT_EQ(timeline.spans().size(), 2U);
    EXPECT_EQ(timeline.endOf(1), nullptr);
    timeline.cut(150);
    EXPECT_EQ(timeline.spans().size(), 1U);
    EXPECT_EQ(timeline.spans().back().end, 1100ms);
    EXPECT_EQ(timeline.spans().back().endFrame, 150);
    timeline.cut(50); // before all: the place to go on from stays known
    EXPECT_EQ(timeline.positionOf(1, 50), 1s);
    EXPECT_EQ(timeline.spans().back().endFrame, 50);
}

TEST(Timeline, ForgetsWhatWasHeardButNotWhereToGoOn) {
    Timeline timeline = twoEntries();
    timeline.forgetBefore(250);
    EXPECT_EQ(timeline.spans().size(), 2U);
    EXPECT_EQ(timeline.positionOf(1, 250), 1300ms);
    timeline.forgetBefore(1000);
    EXPECT_EQ(timeline.spans().size(), 1U);
    EXPECT_EQ(timeline.positionOf(2, 1000), 100ms);
}

} // namespace
} // namespace tarn
