#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <utility>

#include "service/LongFormAudioServer.h"
#include "simulated/SimulatedPlatform.h"
#include "tests/support/CapturedLog.h"

namespace tarn {
namespace {

using testing::ElementsAre;

constexpr char guardLabel[] = "ostrel.tarnd.connectionValidStateGuardQueue";

/// Lets a test step in behind the next piece of work that a thread has waited for.
class WatchedQueue final : public SerialQueue {
public:
    explicit WatchedQueue(std::shared_ptr<SerialQueue> queue) : queue_(std::move(queue)) {}

    void afterNextSync(std::function<void()> step) { step_ = std::move(step); }

    void async(Work work) override { queue_->async(std::move(work)); }
    void sync(const std::function<void()>& work) override {
        queue_->sync(work);
        if (auto step = std::exchange(step_, nullptr))
            step();
    }
    bool isCurrent() const override { return queue_->isCurrent(); }
    const std::string& label() const override { return queue_->label(); }

private:
    const std::shared_ptr<SerialQueue> queue_;
    std::function<void()> step_;
};

class WatchedQueues final : public SerialQueues {
public:
    explicit WatchedQueues(SerialQueues& queues) : queues_(queues) {}

    std::shared_ptr<SerialQueue> create(std::string label) override {
        auto queue = std::make_shared<WatchedQueue>(queues_.create(label));
        made_[label] = queue;
        return queue;
    }
    SerialQueue& main() override { return queues_.main(); }
    void runMainLoop() override { queues_.runMainLoop(); }

    WatchedQueue& queue(const std::string& label) { return *made_.at(label); }

    bool isAnyCurrent() const {
        for (const auto& [label, queue] : made_)
            if (queue->isCurrent())
                return true;
        return queues_.main().isCurrent();
    }

private:
    SerialQueues& queues_;
    std::map<std::string, std::shared_ptr<WatchedQueue>> made_;
};

using Notes = std::vector<std::string>;

/// Writes down what is done with it, and whether it was the current connection by then.
class NotedConnection final : public ServiceConnection, public VLLongFormAudioClientProtocol {
public:
    NotedConnection(Notes& notes, VLLongFormAudioServer& service, const WatchedQueues& queues,
                    const SimulatedNowPlayingService& nowPlaying)
        : notes_(notes), service_(service), queues_(queues), nowPlaying_(nowPlaying) {}
    ~NotedConnection() override {
        notes_.push_back(queues_.isAnyCurrent() ? "destroyed on a queue" : "destroyed");
        if (nowPlaying_.parentApplication())
            notes_.back() += " while now playing has an application";
    }

    void setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol>) override { note("object"); }
    void resume() override { note("resumed"); }
    void setInterruptionHandler(std::function<void()>) override { note("interruption"); }
    void setInvalidationHandler(std::function<void()>) override { note("invalidation"); }
    VLLongFormAudioClientProtocol& remoteObjectProxy() override { return *this; }
    void receiveData(const Data&) override { notes_.push_back("event"); }

private:
    void note(std::string what) {
        notes_.push_back(std::move(what) + (service_.clientConnection().get() == this ? ", current" : ""));
    }

    Notes& notes_;
    VLLongFormAudioServer& service_;
    const WatchedQueues& queues_;
    const SimulatedNowPlayingService& nowPlaying_;
};

class NoListener final : public ServiceListener {
public:
    void setDelegate(ServiceListenerDelegate*) override {}
    void resume() override {}
};

/// What the service does with a connection, step by step on one thread.
class ConnectionTest : public testing::Test {
protected:
    Platform roles() {
        const Platform all = device_.roles();
        return {all.clock,          queues_,        all.listeners,    all.localization,
                all.notifications,  all.media,      all.audioSession, all.sandboxExtensions,
                all.remoteCommands, all.nowPlaying, all.applications};
    }

    std::shared_ptr<ServiceConnection> makeConnection(Notes& notes) {
        return std::make_shared<NotedConnection>(notes, *service_, queues_, device_.nowPlaying);
    }

    Notes first_; // the service may hold a connection to the end
    Notes second_;
    SimulatedPlatform device_{1};
    WatchedQueues queues_{device_.queues};
    const std::shared_ptr<VLLongFormAudioServer> service_ = std::make_shared<VLLongFormAudioServer>(roles());
};

TEST_F(ConnectionTest, IsResumedAndThenHasItsHandlersBeforeItBecomesTheCurrentOne) {
    auto connection = makeConnection(first_);
    NoListener listener;
    EXPECT_TRUE(service_->listenerShouldAcceptNewConnection(listener, connection));
    EXPECT_THAT(first_, ElementsAre("object", "resumed", "interruption", "invalidation"));
    EXPECT_EQ(service_->clientConnection(), connection);
    EXPECT_TRUE(service_->_connectionIsValid());
}

TEST_F(ConnectionTest, GoesOnNoQueueWhenItIsReplacedOrLost) {
    service_->_replaceCurrentConnectionWithConnection(makeConnection(first_));
    service_->_replaceCurrentConnectionWithConnection(makeConnection(second_));
    EXPECT_THAT(first_, ElementsAre("destroyed"));
    device_.nowPlaying.setParentApplication(device_.nowPlaying.localOrigin(), "ostrel.music");
    service_->_connectionWasInvalidated();
    EXPECT_THAT(second_, ElementsAre("destroyed while now playing has an application"));
    EXPECT_EQ(device_.nowPlaying.parentApplication(), std::nullopt);
}

// Validity and connection are one question: asked one after the other, the connection may be gone by the
// second, and an event of one client may go to the next.
TEST_F(ConnectionTest, ThatIsLostWhileAnEventIsSentStillGetsIt) {
    for (const bool isReplaced : {false, true}) {
        first_.clear();
        second_.clear();
        service_->_replaceCurrentConnectionWithConnection(makeConnection(first_));
        queues_.queue(guardLabel).afterNextSync([&] {
            service_->_replaceCurrentConnectionWithConnection(isReplaced ? makeConnection(second_) : nullptr);
        });
        service_->sendData({1});
        EXPECT_THAT(first_, ElementsAre("event", "destroyed"));
        service_->_replaceCurrentConnectionWithConnection(nullptr);
        EXPECT_THAT(second_, isReplaced ? Notes{"destroyed"} : Notes{});
    }
}

TEST_F(ConnectionTest, ThatIsNoLongerValidGetsNoEvents) {
    auto connection = makeConnection(first_);
    service_->_replaceCurrentConnectionWithConnection(connection);
    service_->_setConnectionIsValid(false);
    service_->sendData({1});
    EXPECT_THAT(first_, testing::IsEmpty());
}

} // namespace
} // namespace tarn
