#include <gtest/gtest.h>

#include "tests/player/Listening.h"
#include "tests/support/CapturedLog.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

MediaScript unplayable() {
    MediaScript script;
    script.unplayable = Error{"SimulatedMedia", 7, {}};
    return script;
}

TEST(Trouble, AQueueOfItemsThatCannotBePlayedRunsOut) {
    Listening test;
    auto a = test.item("a", unplayable()), b = test.item("b", unplayable());
    test.play({}, 1);
    test.reports();
    test.player->insertItem(a, nullptr);
    test.player->insertItem(b, nullptr);
    EXPECT_EQ(test.reports(), "0.000: current a\n"
                              "0.000: a failed\n"
                              "0.000: a did not play to its end\n"
                              "0.000: current b\n"
                              "0.000: b failed\n"
                              "0.000: b did not play to its end\n"
                              "0.000: current none\n"
                              "0.000: rate 0\n");
    EXPECT_EQ(test.platform.media.speaker().outputs(), 0U);
    test.player->insertItem(a, nullptr); // fails again, but it is nothing new
    EXPECT_EQ(test.reports(), "0.000: current a\n0.000: a did not play to its end\n0.000: current none\n");
}

TEST(Trouble, AnItemThatTakesItsTimeToOpenIsReadyThen) {
    Listening test;
    MediaScript slow;
    slow.duration = 3s;
    slow.readyAfter = 2s;
    MediaScript slowAndBad = unplayable();
    slowAndBad.readyAfter = 4s;
    auto a = test.item("a", slow), b = test.item("b", slowAndBad), c = test.item("c", slow);
    test.play({a, b, c});
    test.advance(1900ms);
    EXPECT_EQ(a->status(), MediaStatus::unknown);
    EXPECT_EQ(test.player->rate(), 1.0F) << "it plays as soon as it can";
    EXPECT_EQ(a->currentTime().seconds(), 0.0);
    EXPECT_EQ(test.reports(), "0.000: rate 1\n");
    test.advance(8s);
    EXPECT_EQ(test.reports(), "2.000: a ready\n"
                              "4.000: b failed\n"
                              "4.000: b did not play to its end\n"
                              "5.000: a played to its end\n"
                              "5.000: current c\n"
                              "6.000: c ready\n"
                              "9.000: c played to its end\n"
                              "9.000: current none\n"
                              "9.000: rate 0\n");
    EXPECT_EQ(test.heard(), "2.000-5.000 a 0.000..3.000\n6.000-9.000 c 0.000..3.000\n");
}

TEST(Trouble, APausedItemThatCannotBeOpenedFailsWhenThatIsKnown) {
    Listening test;
    MediaScript slow = unplayable();
    slow.readyAfter = 2s;
    test.play({test.item("a", slow)}, 0);
    test.advance(3s);
    EXPECT_EQ(test.reports(), "2.000: a failed\n2.000: a did not play to its end\n2.000: current none\n");
}

TEST(Trouble, AFileThatBreaksIsHeardUpToThere) {
    Listening test;
    MediaScript script;
    script.duration = 10s;
    script.breaksAt = 4s;
    auto a = test.item("a", script);
    test.play({a, test.item("b", 2s)});
    test.advance(3900ms);
    EXPECT_EQ(test.reports(), "0.000: rate 1\n") << "what is known ahead is not reported ahead";
    test.advance(10s);
    EXPECT_EQ(test.reports(), "4.000: a failed\n"
                              "4.000: a did not play to its end\n"
                              "4.000: current b\n"
                              "6.000: b played to its end\n"
                              "6.000: current none\n"
                              "6.000: rate 0\n");
    EXPECT_EQ(test.heard(), "0.000-4.000 a 0.000..4.000\n4.000-6.000 b 0.000..2.000\n");
    EXPECT_EQ(a->error()->code, 1);
    EXPECT_EQ(a->currentTime().seconds(), 4.0);

    // What has failed is not tried again, wherever it stands.
    a->seekToTime({1, 1});
    test.player->insertItem(a, nullptr);
    EXPECT_EQ(test.reports(), "13.900: a jumped\n"
                              "13.900: current a\n"
                              "13.900: a did not play to its end\n"
                              "13.900: current none\n");
}

TEST(Trouble, AStallHoldsThePositionAndDropsNothing) {
    Listening test;
    MediaScript script;
    script.duration = 10s;
    script.stalls = {{0s, 1s}, {5s, 6s}};
    auto a = test.item("a", script);
    test.play({a});
    test.advance(8s);
    EXPECT_EQ(a->currentTime().seconds(), 5.0);
    EXPECT_EQ(test.player->rate(), 1.0F);
    test.advance(20s);
    // What comes at 5 s was asked for when 3 s were heard, and was there 6 s later.
    EXPECT_EQ(test.heard(), "1.000-6.000 a 0.000..5.000\n10.000-15.000 a 5.000..10.000\n");
    EXPECT_EQ(a->currentTime().seconds(), 10.0);
    EXPECT_EQ(test.player->currentItem(), nullptr);
}

TEST(Trouble, ALostSoundServerCostsNothingOfTheFile) {
    Listening test;
    test.platform.media.speaker().setLatency(100ms);
    auto a = test.item("a", 10s);
    test.play({a, test.item("b", 10s)}, 2);
    test.advance(2s);
    test.platform.media.speaker().reset();
    test.advance(1s);
    test.player->pause();
    test.platform.media.speaker().reset();
    test.advance(1s);
    EXPECT_EQ(a->currentTime().seconds(), 6.0);
    test.player->setRate(1);
    test.advance(5s);
    EXPECT_EQ(test.heard(),
              "0.000-3.000 a 0.000..6.000\n4.000-8.000 a 6.000..10.000\n8.000-9.000 b 0.000..1.000\n");
}

/// The reason comes before the pause, and what resumes what it has paused does not start over another device.
TEST(Trouble, ALostDevicePausesUntilARateIsSet) {
    Listening test;
    test.play({test.item("a", 60s)}, 1.5F);
    test.advance(2s);
    test.platform.media.speaker().loseDevice();
    EXPECT_EQ(test.reports(), "0.000: rate 1.5\n2.000: sound error 3\n2.000: rate 0\n");
    test.player->play();
    EXPECT_EQ(test.reports(), "");
    test.platform.media.speaker().loseDevice(); // it is paused already
    test.settle();
    test.player->setRate(2);
    EXPECT_EQ(test.reports(), "2.000: sound\n2.000: rate 2\n");

    test.platform.audioSession.beginInterruption();
    test.settle();
    test.platform.media.speaker().loseDevice();
    test.settle();
    test.player->play();
    EXPECT_EQ(test.reports(), "2.000: rate 0\n2.000: sound error 3\n");
}

TEST(Trouble, SilenceIsToldAndOver) {
    Listening test;
    test.play({test.item("a", 60s)});
    const Error error{"sound", 1, {}};
    test.platform.media.speaker().tellSound(error);
    test.platform.media.speaker().tellSound(error); // no news
    test.settle();
    EXPECT_EQ(test.player->error(), error);
    test.player->setRate(2); // in silence
    test.platform.media.speaker().tellSound(std::nullopt);
    EXPECT_EQ(test.reports(), "0.000: rate 1\n0.000: sound error 1\n0.000: rate 2\n0.000: sound\n");

    test.player->pause();
    test.player->soundFailed(error); // when it was to play again
    test.player->setRate(1);
    EXPECT_EQ(test.reports(), "0.000: rate 0\n0.000: sound error 1\n0.000: sound\n0.000: rate 1\n");
}

TEST(Interruption, PausesWhatSoundsAndPlayGoesOnAtItsRate) {
    Listening test;
    auto other = test.platform.media.makeQueuePlayer({test.item("b", 10s)});
    other->setAudioSession(test.platform.audioSession);
    auto unbound = test.platform.media.makeQueuePlayer({test.item("c", 10s)});
    unbound->play();
    test.play({test.item("a", 60s)}, 1.5F);
    EXPECT_EQ(test.player->audioSession(), &test.platform.audioSession);
    test.advance(2s);
    test.platform.audioSession.beginInterruption();
    test.settle();
    EXPECT_EQ(test.player->rate(), 0.0F);
    EXPECT_EQ(unbound->rate(), 1.0F);
    test.platform.audioSession.beginInterruption(); // no news
    test.settle();
    test.player->play();
    other->play();
    EXPECT_EQ(test.player->rate(), 1.5F);
    EXPECT_EQ(other->rate(), 1.0F) << "had not sounded";

    test.platform.audioSession.beginInterruption();
    test.settle();
    test.player->pause(); // by the listener, who wants it to stay so
    test.player->play();
    EXPECT_EQ(test.player->rate(), 0.0F);
    test.player->play();
    EXPECT_EQ(test.player->rate(), 1.0F) << "what was before does not count any more";
}

TEST(TwoPlayers, TheNewestOneDrivesTheItemsTheyShare) {
    Listening test;
    auto a = test.item("a", 10s), b = test.item("b", 10s);
    test.play({a, b});
    auto old = test.player;
    test.advance(4s);
    test.reports();
    test.play({a, b}, 0);
    EXPECT_EQ(a->currentTime().seconds(), 4.0) << "goes on where the item is";
    test.player->setRate(2);
    test.settle();
    test.advance(1s);
    EXPECT_EQ(a->currentTime().seconds(), 6.0);
    EXPECT_EQ(old->currentTime().seconds(), 5.0);
    old.reset();
    test.settle();
    EXPECT_EQ(test.platform.media.speaker().outputs(), 1U);
    test.advance(2s);
    EXPECT_EQ(test.reports(), "4.000: rate 2\n7.000: a played to its end\n7.000: current b\n");
}

TEST(TwoPlayers, TheOneBeforeDrivesWhatTheNewestLetsGo) {
    Listening test;
    auto a = test.item("a", 10s), b = test.item("b", 10s);
    test.play({a, b});
    auto oldest = test.player;
    test.advance(4s);
    test.play({a}, 0);
    auto middle = test.player;
    test.play({a}, 0);
    middle.reset();
    test.player.reset();
    test.advance(1s);
    EXPECT_EQ(a->currentTime().seconds(), 5.0);
    test.reports();
    a->seekToTime({9, 1});
    test.advance(2s);
    EXPECT_EQ(test.reports(), "5.000: a jumped\n6.000: a played to its end\n6.000: current b\n");
    EXPECT_EQ(b->currentTime().seconds(), 1.0);
}

TEST(LastReference, SilencesThePlayerWhereverItIsDropped) {
    auto before = LiveObjects::counts();
    {
        Listening test;
        auto a = test.item("a", 10s);
        test.play({a, test.item("b", 10s)});
        auto inside = test.platform.notifications.addObserver(
            MediaItem::didPlayToEndTime, a.get(), [&](const Notification&) { test.player.reset(); });
        test.advance(9s);
        EXPECT_EQ(test.platform.media.speaker().soundingOutputs(), 1U);
        test.advance(2s);
        EXPECT_EQ(test.platform.media.speaker().outputs(), 0U) << "on the player thread";
        EXPECT_EQ(a->currentTime().seconds(), 10.0);

        test.play({a});
        test.advance(1s);
        test.player.reset();
        test.settle();
        EXPECT_EQ(test.platform.media.speaker().outputs(), 0U);
        EXPECT_EQ(a->currentTime().seconds(), 1.0);
    }
    for (const auto& [kind, count] : LiveObjects::counts())
        EXPECT_EQ(count, before[kind]) << kind;
}

} // namespace
} // namespace tarn
