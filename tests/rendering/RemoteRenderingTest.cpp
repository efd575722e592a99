#include <gtest/gtest.h>

#include <cstdlib>
#include <semaphore>

#include "mediaprotocol/MediaError.h"
#include "observation/LocalNotificationCenter.h"
#include "player/EventLoopThread.h"
#include "player/MediaTimes.h"
#include "player/PlaybackEngine.h"
#include "rendering/RemoteRendering.h"
#include "sound/LinuxAudioSession.h"
#include "sound/SystemOutput.h"
#include "tests/support/Events.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

/// A file that answers up to some place, and from there on when it is let go.
class StallingAsset final : public MediaAsset {
public:
    StallingAsset(nanoseconds wholeLength, nanoseconds firstStall) : length(wholeLength), stall(firstStall) {}

    const std::string& URL() const override { return URL_; }
    const std::vector<MediaMetadataItem>& commonMetadata() const override { return metadata_; }
    MediaTime duration() const override { return mediaTimeOf(length); }

    /// What a read does: waits when it comes behind the place.
    void read(nanoseconds position) {
        if (position < stall)
            return;
        stalled.release();
        answers_.acquire();
        answers_.release();
    }

    void answer() { answers_.release(); }

    const nanoseconds length;
    const nanoseconds stall;
    std::counting_semaphore<> stalled{0}; ///< released by each read that has to wait

private:
    std::counting_semaphore<> answers_{0};
    const std::string URL_ = "file:///remote";
    const std::vector<MediaMetadataItem> metadata_;
};

class StallingRendering final : public Rendering {
public:
    explicit StallingRendering(std::shared_ptr<StallingAsset> asset) : asset_(std::move(asset)) {}

    void seek(nanoseconds position, float, const PcmFormat& format) override {
        position_ = std::min(position, asset_->length);
        format_ = format;
    }

    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override {
        asset_->read(position_);
        RenderedSpan span;
        const auto left =
            static_cast<std::size_t>((asset_->length - position_).count() * format_.rate / 1'000'000'000);
        span.frames = std::min(left, maxFrames);
        span.start = position_;
        position_ += nanoseconds(span.frames * 1'000'000'000 / format_.rate);
        span.state = span.frames == left ? RenderedSpan::State::ended : RenderedSpan::State::more;
        span.end = position_;
        buffer.bytes.resize(buffer.bytes.size() + span.frames * format_.bytesPerFrame());
        buffer.frames += span.frames;
        return span;
    }

private:
    const std::shared_ptr<StallingAsset> asset_;
    nanoseconds position_{0};
    PcmFormat format_;
};

class RemoteFactory final : public RenderingFactory {
public:
    explicit RemoteFactory(EventLoop& loop) : loop_(loop) {}

    Outcome open(const std::shared_ptr<MediaAsset>& asset, std::function<void()> goesOn) override {
        auto file = std::static_pointer_cast<StallingAsset>(asset);
        const auto openIt = [file] {
            file->read(0ns);
            return Outcome{std::make_unique<StallingRendering>(file), std::nullopt};
        };
        return {RemoteRendering::create(loop_, openIt, std::move(goesOn), {limit, file->length}),
                std::nullopt};
    }

    nanoseconds limit = 10s;

private:
    EventLoop& loop_;
};

struct Parts {
    LocalNotificationCenter notifications;
    LinuxAudioSession session{notifications};
    EventLoopThread loop;
    RemoteFactory renderings{loop};
    SystemOutputFactory outputs{loop, session};
};

class RemoteEngine final : public Parts, public PlaybackEngine {
public:
    RemoteEngine() : PlaybackEngine(loop, renderings, outputs, notifications) {}
    ~RemoteEngine() override { loop.stop(); }
    MediaAssetOutcome openAsset(const std::string&) override { return {}; }
};

struct RemoteRenderingTest : testing::Test {
    RemoteRenderingTest() { setenv("PULSE_SERVER", "unix:/nonexistent", 1); } // so time passes in silence

    std::shared_ptr<MediaItem> makeItem(const std::shared_ptr<StallingAsset>& asset) {
        auto item = engine.makeItem(asset);
        for (const char* name : {MediaItem::didPlayToEndTime, MediaItem::failedToPlayToEndTime})
            registrations.push_back(engine.notifications.addObserver(
                name, item.get(), [this, name](const Notification&) { events.add(name); }));
        return item;
    }

    static constexpr nanoseconds never = 1h;

    Events events;
    RemoteEngine engine;
    std::vector<RegistrationHandle> registrations;
};

TEST_F(RemoteRenderingTest, WhatTheFileDoesNotDeliverIsWaitedForByNobody) {
    const auto slow = std::make_shared<StallingAsset>(3s, 500ms);
    const auto item = makeItem(slow);
    const auto player = engine.makeQueuePlayer({item});
    player->setRate(1);
    slow->stalled.acquire();

    // Another player comes to its end on the same thread, and this one obeys.
    const auto other = engine.makeQueuePlayer({makeItem(std::make_shared<StallingAsset>(200ms, never))});
    other->setRate(1);
    EXPECT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    player->pause();
    const auto position = item->currentTime();
    EXPECT_LE(position.seconds(), 0.5);
    item->seekToTime(MediaTime::fromSeconds(0.25, 1'000));
    EXPECT_DOUBLE_EQ(item->currentTime().seconds(), 0.25);
    player->setRate(1);

    slow->answer();
    EXPECT_TRUE(events.wait(MediaItem::didPlayToEndTime)) << "it goes on where it was";
    EXPECT_EQ(item->status(), MediaStatus::readyToPlay);
}

TEST_F(RemoteRenderingTest, AnItemIsReadyWhenItsFileIsOpen) {
    const auto slow = std::make_shared<StallingAsset>(100ms, 0s);
    const auto item = makeItem(slow);
    registrations.push_back(item->observe(MediaItem::statusKeyPath, [this](Observable&, const auto& change) {
        if (std::get<std::int64_t>(change.at("new")) == static_cast<std::int64_t>(MediaStatus::readyToPlay))
            events.add("ready");
    }));
    const auto player = engine.makeQueuePlayer({item});
    slow->stalled.acquire();
    EXPECT_EQ(item->status(), MediaStatus::unknown);
    slow->answer();
    EXPECT_TRUE(events.wait("ready")) << "though nobody plays it";
}

TEST_F(RemoteRenderingTest, AFileThatDoesNotAnswerInTimeFailsAndTheQueueGoesOn) {
    engine.renderings.limit = 50ms;
    for (const nanoseconds stall : {0ns, nanoseconds(375ms)}) {
        const auto stuck = std::make_shared<StallingAsset>(3s, stall);
        const auto item = makeItem(stuck);
        const auto next = makeItem(std::make_shared<StallingAsset>(100ms, never));
        const auto player = engine.makeQueuePlayer({item, next});
        player->setRate(1);
        ASSERT_TRUE(events.wait(MediaItem::failedToPlayToEndTime)) << stall.count();
        EXPECT_EQ(item->status(), MediaStatus::failed);
        ASSERT_TRUE(item->error());
        EXPECT_EQ(item->error()->code, static_cast<std::int64_t>(MediaErrorCode::timedOut));
        EXPECT_TRUE(events.wait(MediaItem::didPlayToEndTime)) << stall.count();
        stuck->answer();
    }
}

TEST_F(RemoteRenderingTest, IsLeftBehindWhileItsFileIsStuck) {
    const auto stuck = std::make_shared<StallingAsset>(3s, 0s);
    {
        const auto player = engine.makeQueuePlayer({makeItem(stuck)});
        player->setRate(1);
        stuck->stalled.acquire();
    }
    const auto other = engine.makeQueuePlayer({makeItem(std::make_shared<StallingAsset>(100ms, never))});
    other->setRate(1);
    EXPECT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    stuck->answer();
}

} // namespace
} // namespace tarn
