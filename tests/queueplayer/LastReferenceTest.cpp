#include <gtest/gtest.h>

#include "roles/AudioSession.h"
#include "tests/support/ClientStory.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using namespace commands;

/// A client destroys an object while one of its reports is on its way. The report then holds the last
/// reference, and the object dies on the thread that delivers it.
class LastReferenceTest : public ClientStory {
protected:
    LastReferenceTest() {
        mirror({"a", "b"});
        tell(setRate("player", 1));
    }

    void destroyItemDuring(const std::string& report) {
        client->transcript().whenPushed(report, [this] {
            client->itemQueue().sync([this] { client->items->destroyPlayerItemWithIdentifier("a"); });
            EXPECT_EQ(LiveObjects::counts()["player item"], 2);
        });
    }

    void destroyPlayerDuring(const std::string& report) {
        client->transcript().whenPushed(report, [this] {
            client->playerQueue().sync(
                [this] { client->players->destroyQueuePlayerWithIdentifier("player"); });
            EXPECT_EQ(LiveObjects::counts()["queue player"], 1);
        });
    }

    void expectItemGone() { EXPECT_EQ(LiveObjects::counts()["player item"], 1); }
    void expectPlayerGone() {
        EXPECT_EQ(LiveObjects::counts()["queue player"], 0);
        EXPECT_EQ(LiveObjects::counts()["media queue player"], 0);
    }
};

TEST_F(LastReferenceTest, AnItemDiesOnThePlayerThread) {
    destroyItemDuring("playerItem.notifyDidPlayToEndTime identifier=a");
    pass(10s);
    expectItemGone();
}

TEST_F(LastReferenceTest, AQueuePlayerDiesOnThePlayerThread) {
    destroyPlayerDuring("queuePlayer.setCurrentItem");
    pass(10s);
    expectPlayerGone();
}

TEST_F(LastReferenceTest, AQueuePlayerDiesOnTheThreadOfALateActivation) {
    tell(setRate("player", 0));
    device.audioSession.willActivate({.after = 20s});
    tell(setRate("player", 1));
    pass(17s);
    destroyPlayerDuring("queuePlayer.setRate identifier=player rate=1");
    pass(3s);
    expectPlayerGone();
}

} // namespace
} // namespace tarn
