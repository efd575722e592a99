#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>

#include "objects/PlayerItem.h"
#include "observation/LocalNotificationCenter.h"
#include "observation/ObserverList.h"

namespace tarn {
namespace {

/// Writes down when it goes.
class Noted final : public Registration {
public:
    Noted(std::string& journal, const char* name) : journal_(journal), name_(name) {}
    ~Noted() override { journal_.append(name_).append(" "); }

private:
    std::string& journal_;
    const char* const name_;
};

/// What an item is given, writing down when it is let go.
class NotedItem final : public MediaItem {
public:
    explicit NotedItem(std::string& journal) : journal_(journal), end_(journal, "item") {}
    RegistrationHandle observe(std::string_view, Block) override {
        return std::make_unique<Noted>(journal_, "observation");
    }
    MediaStatus status() const override { return MediaStatus::unknown; }
    std::optional<Error> error() const override { return std::nullopt; }
    const std::shared_ptr<MediaAsset>& asset() const override { return asset_; }
    MediaTime currentTime() const override { return MediaTime::zero(); }
    void seekToTime(MediaTime) override {}

private:
    std::string& journal_;
    const std::shared_ptr<MediaAsset> asset_;
    Noted end_;
};

class NotedCenter final : public NotificationCenter {
public:
    explicit NotedCenter(std::string& journal) : journal_(journal) {}
    RegistrationHandle addObserver(std::initializer_list<std::string_view>, const void*, Handler) override {
        return std::make_unique<Noted>(journal_, "notifications");
    }
    void post(const Notification&) override {}

private:
    std::string& journal_;
};

class NotedSink final : public EventSink {
public:
    explicit NotedSink(std::string& journal) : end_(journal, "server") {}
    void sendData(const Data&) override {}

private:
    Noted end_;
};

TEST(PlayerItemTest, EndsItsReportsBeforeItLetsGoOfWhatTheyAreAbout) {
    std::string journal;
    NotedCenter notifications(journal);
    auto item = VLTorviAudioFilePlayerItem::initWithPlayerItem(
        notifications, std::make_shared<NotedItem>(journal), "item", std::make_shared<NotedSink>(journal));
    EXPECT_EQ(journal, "");
    item.reset();
    EXPECT_EQ(journal, "notifications server observation item ");
}

/// A media item whose status the test sets, on real threads.
class ScriptedItem final : public MediaItem {
public:
    RegistrationHandle observe(std::string_view keyPath, Block block) override {
        return observers_.observe(keyPath, std::move(block));
    }
    MediaStatus status() const override { return status_; }
    std::optional<Error> error() const override { return std::nullopt; }
    const std::shared_ptr<MediaAsset>& asset() const override { return asset_; }
    MediaTime currentTime() const override { return MediaTime::zero(); }
    void seekToTime(MediaTime) override {}

    void setStatus(MediaStatus status) {
        status_ = status;
        observers_.changed(statusKeyPath);
    }

private:
    std::atomic<MediaStatus> status_ = MediaStatus::unknown;
    const std::shared_ptr<MediaAsset> asset_;
    ObserverList observers_{*this, [](const Observable& self, std::string_view) {
                                const auto& item = static_cast<const ScriptedItem&>(self);
                                return ObservedValue(static_cast<std::int64_t>(item.status()));
                            }};
};

class CountingSink final : public EventSink {
public:
    void sendData(const Data&) override { ++count; }
    std::atomic<int> count = 0;
};

// Reports and the last reference meet on the threads that report.
TEST(PlayerItemThreadsTest, ReportsWhileItIsMadeAndDestroyed) {
    constexpr int rounds = 2000;
    LocalNotificationCenter notifications;
    auto media = std::make_shared<ScriptedItem>();
    auto sink = std::make_shared<CountingSink>();
    std::atomic<bool> finished = false;
    std::jthread poster([&] {
        while (!finished)
            notifications.post({MediaItem::timeJumped, static_cast<MediaItem*>(media.get()), {}});
    });
    std::jthread changer([&] {
        while (!finished)
            media->setStatus(MediaStatus::readyToPlay);
    });
    std::weak_ptr<VLTorviAudioFilePlayerItem> last;
    for (int round = 0; round < rounds; ++round)
        last = VLTorviAudioFilePlayerItem::initWithPlayerItem(notifications, media, "item", sink);
    finished = true;
    poster.join();
    changer.join();
    EXPECT_TRUE(last.expired());
    EXPECT_GE(sink->count, rounds); // at least the first status of each
}

TEST(PlayerItemThreadsTest, SaysNothingWithoutAServiceToSayItTo) {
    LocalNotificationCenter notifications;
    auto media = std::make_shared<ScriptedItem>();
    auto item = VLTorviAudioFilePlayerItem::initWithPlayerItem(notifications, media, "item", nullptr);
    media->setStatus(MediaStatus::failed);
    notifications.post({MediaItem::didPlayToEndTime, static_cast<MediaItem*>(media.get()), {}});
    EXPECT_EQ(item->playerItem(), media);
}

} // namespace
} // namespace tarn
