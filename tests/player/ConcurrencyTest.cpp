#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <thread>

#include "simulated/SimulatedQueue.h"
#include "tests/player/Listening.h"
#include "tests/player/ThreadLoop.h"
#include "tests/support/CapturedLog.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

/// Does to a player, at random, what clients, media keys and calls do.
class Meddler {
public:
    Meddler(std::uint64_t seed, std::vector<std::shared_ptr<MediaItem>> items, AudioSession& session,
            NotificationCenter& notifications, SimulatedSpeaker& speaker)
        : engine_(seed),
          items_(std::move(items)),
          session_(session),
          notifications_(notifications),
          speaker_(speaker) {}

    void meddle(MediaQueuePlayer& player) {
        static constexpr float rates[] = {0.0F, 1.0F, 1.0F, 2.0F, 0.5F, -1.0F, -0.25F, 30.0F};
        const auto& item = items_[pick(items_.size())];
        switch (pick(13)) {
        case 0:
            return player.setRate(rates[pick(std::size(rates))]);
        case 1:
            return player.play();
        case 2:
            return player.pause();
        case 3:
            return player.advanceToNextItem();
        case 4:
            return player.replaceCurrentItem(item);
        case 5:
            return player.removeItem(item);
        case 6:
            return player.removeAllItems();
        case 7:
            return item->seekToTime({static_cast<std::int64_t>(pick(9000)), 1000});
        case 8:
            return interrupt();
        case 9:
            return speaker_.reset();
        default:
            return player.insertItem(item, items_[pick(items_.size())]);
        }
    }

    std::size_t pick(std::size_t limit) { return static_cast<std::size_t>(engine_() % limit); }

private:
    void interrupt() {
        notifications_.post({.name = AudioSession::interruptionNotification,
                             .sender = &session_,
                             .info = {{AudioSession::interruptionTypeKey, AudioSession::interruptionBegan}}});
    }

    std::mt19937_64 engine_;
    const std::vector<std::shared_ptr<MediaItem>> items_;
    AudioSession& session_;
    NotificationCenter& notifications_;
    SimulatedSpeaker& speaker_;
};

class SeededPlayer : public testing::TestWithParam<int> {};

/// What the player says agrees with what is heard, whatever was done to it by several threads at a time.
TEST_P(SeededPlayer, SaysWhatIsHeard) {
    CapturedLog log; // items that are in the queue already
    Listening test(static_cast<std::uint64_t>(GetParam()));
    auto& scheduler = test.platform.scheduler;
    test.platform.media.speaker().setLatency(scheduler.random(2) == 0 ? 0ms : 100ms);
    MediaScript broken;
    broken.duration = 10s;
    broken.breaksAt = 7s;
    std::vector<std::shared_ptr<MediaItem>> items;
    for (const char* name : {"a", "b", "c", "d"})
        items.push_back(test.item(name, 10s));
    items.push_back(test.item("broken", broken));
    items.push_back(test.item("short", 20ms));
    test.play({items[0], items[1]});
    Meddler meddler(scheduler.random(1U << 30), items, test.platform.audioSession,
                    test.platform.notifications, test.platform.media.speaker());
    std::vector<std::shared_ptr<SimulatedQueue>> threads;
    threads.reserve(3);
    for (int i = 0; i < 3; ++i)
        threads.push_back(scheduler.createQueue("thread"));
    for (int round = 0; round < 60; ++round) {
        for (const auto& thread : threads)
            for (std::size_t calls = meddler.pick(3); calls > 0; --calls)
                thread->async([&] { meddler.meddle(*test.player); });
        test.advance(std::chrono::milliseconds(150 + meddler.pick(4000)));
        auto current = test.player->currentItem();
        if (test.player->rate() == 0 || !current) {
            ASSERT_EQ(test.platform.media.speaker().soundingOutputs(), 0U) << "round " << round;
            continue;
        }
        auto last = test.platform.media.speaker().heard().back();
        ASSERT_EQ(last.to, scheduler.now()) << "round " << round;
        ASSERT_EQ(last.URL, test.nameOf(current)) << "round " << round;
        ASSERT_NEAR(std::chrono::duration<double>(last.end).count(), test.player->currentTime().seconds(),
                    1e-6)
            << "round " << round;
    }
    test.player.reset();
    test.settle();
    EXPECT_EQ(test.platform.media.speaker().outputs(), 0U);
}

INSTANTIATE_TEST_SUITE_P(Seeds, SeededPlayer, testing::Range(1, 301));

/// The same on real threads, for the thread sanitizer: players come and go while others call them.
TEST(Threads, ShareItemsAndPlayers) {
    CapturedLog log;
    auto before = LiveObjects::counts();
    {
        ThreadLoop loop;
        LocalNotificationCenter notifications;
        SimulatedSandboxExtension sandbox;
        SimulatedMediaEngine engine(loop, notifications, sandbox);
        SimulatedScheduler scheduler(1); // only for the session, which nothing is asked of
        SimulatedAudioSession session(scheduler, notifications);
        MediaScript script;
        script.duration = 10ms;
        engine.addFile("file", script);
        auto asset = engine.openAsset("file").asset;
        std::vector<std::shared_ptr<MediaItem>> items;
        items.reserve(6);
        for (int i = 0; i < 6; ++i)
            items.push_back(engine.makeItem(asset));
        auto meddle = [&](std::uint64_t seed) {
            Meddler meddler(seed, items, session, notifications, engine.speaker());
            for (int life = 0; life < 20; ++life) {
                auto player = engine.makeQueuePlayer(items);
                player->setAudioSession(session);
                auto watch = player->observe(MediaQueuePlayer::rateKeyPath, [](Observable& object, auto&) {
                    static_cast<MediaQueuePlayer&>(object).currentTime();
                });
                for (int i = 0; i < 50; ++i) {
                    meddler.meddle(*player);
                    items[meddler.pick(items.size())]->currentTime();
                }
            }
        };
        std::vector<std::thread> threads;
        for (std::uint64_t seed = 1; seed <= 3; ++seed)
            threads.emplace_back(meddle, seed);
        for (auto& thread : threads)
            thread.join();
        loop.finish();
        EXPECT_EQ(engine.speaker().outputs(), 0U);
    }
    for (const auto& [kind, count] : LiveObjects::counts())
        EXPECT_EQ(count, before[kind]) << kind;
}

} // namespace
} // namespace tarn
