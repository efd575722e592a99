#include "player/CoreQueuePlayer.h"

#include <cassert>
#include <cmath>
#include <utility>

#include "log/SystemLog.h"
#include "player/CoreMediaItem.h"
#include "player/MediaTimes.h"
#include "roles/AudioSession.h"
#include "roles/NotificationCenter.h"

namespace tarn {

namespace {

std::shared_ptr<CoreMediaItem> coreItem(std::shared_ptr<MediaItem> item) {
    assert(dynamic_cast<CoreMediaItem*>(item.get()) && "an item of another engine");
    return std::static_pointer_cast<CoreMediaItem>(std::move(item));
}

const CoreMediaItem* coreItem(const MediaItem* item) { return static_cast<const CoreMediaItem*>(item); }

void reportDuplicate(std::string_view method) {
    SystemLog::error(method, __LINE__, "%{public}s:%d: Refused an item that is in the queue already.");
}

} // namespace

std::shared_ptr<CoreQueuePlayer> CoreQueuePlayer::create(PlayerEnvironment& environment,
                                                         std::vector<std::shared_ptr<MediaItem>> items) {
    auto player = std::make_shared<CoreQueuePlayer>(environment);
    player->playback_->setListener(player);
    for (auto& item : items)
        player->insertItem(std::move(item), nullptr);
    return player;
}

CoreQueuePlayer::CoreQueuePlayer(PlayerEnvironment& environment)
    : environment_(environment),
      playback_(std::make_shared<Playback>(environment)),
      observers_(*this, [](const Observable& object, std::string_view keyPath) {
          return static_cast<const CoreQueuePlayer&>(object).read(keyPath);
      }) {}

CoreQueuePlayer::~CoreQueuePlayer() { playback_->close(); }

RegistrationHandle CoreQueuePlayer::observe(std::string_view keyPath, Block block) {
    return observers_.observe(keyPath, std::move(block));
}

ObservedValue CoreQueuePlayer::read(std::string_view keyPath) const {
    if (keyPath == rateKeyPath)
        return rate();
    if (keyPath == currentItemKeyPath)
        return currentItem();
    assert(keyPath == statusKeyPath);
    return static_cast<std::int64_t>(status());
}

float CoreQueuePlayer::rate() const {
    EngineLock lock(environment_);
    return playback_->queue().rate();
}

std::shared_ptr<MediaItem> CoreQueuePlayer::currentItem() const {
    EngineLock lock(environment_);
    return playback_->queue().current();
}

MediaTime CoreQueuePlayer::currentTime() const {
    EngineLock lock(environment_);
    const PlayQueue::Entries& entries = playback_->queue().entries();
    if (entries.empty())
        return MediaTime::zero();
    return mediaTimeOf(playback_->queue().positionOf(*entries.front().item));
}

template <class Change>
void CoreQueuePlayer::changeRate(Change change) {
    bool changed = false;
    {
        EngineLock lock(environment_);
        changed = change(playback_->queue());
    }
    if (changed)
        rateChanged();
}

void CoreQueuePlayer::setRate(float rate) {
    if (!std::isfinite(rate)) {
        SystemLog::error("-[MediaQueuePlayer setRate:]", __LINE__,
                         "%{public}s:%d: Refused a rate that is not finite: %f.", rate);
        return;
    }
    changeRate([rate](PlayQueue& queue) { return queue.setRate(rate); });
}

void CoreQueuePlayer::pause() {
    changeRate([](PlayQueue& queue) { return queue.setRate(0); });
}

void CoreQueuePlayer::play() {
    changeRate([](PlayQueue& queue) { return queue.play(); });
}

void CoreQueuePlayer::interruptionBegan() {
    changeRate([](PlayQueue& queue) { return queue.interrupt(); });
}

void CoreQueuePlayer::deviceVanished() {
    SystemLog::message("-[MediaQueuePlayer deviceVanished]", __LINE__,
                       "%{public}s:%d: Paused: the device that played is gone.");
    pause();
}

template <class Edit>
void CoreQueuePlayer::edit(Edit edit) {
    PlayQueue::Entries left; // outlives the lock
    bool changed = false;
    {
        EngineLock lock(environment_);
        PlayQueue& queue = playback_->queue();
        const CoreMediaItem* before = queue.current().get(); // kept alive by `left`
        left = edit(queue);
        changed = queue.current().get() != before;
    }
    if (changed)
        currentItemChanged();
}

void CoreQueuePlayer::advanceToNextItem() {
    edit([](PlayQueue& queue) { return queue.removeFirst(); });
}

void CoreQueuePlayer::insertItem(std::shared_ptr<MediaItem> item, const std::shared_ptr<MediaItem>& after) {
    bool inserted = false;
    edit([&](PlayQueue& queue) {
        inserted = queue.insert(coreItem(std::move(item)), coreItem(after.get()));
        return PlayQueue::Entries();
    });
    if (!inserted)
        reportDuplicate("-[MediaQueuePlayer insertItem:afterItem:]");
}

void CoreQueuePlayer::removeItem(const std::shared_ptr<MediaItem>& item) {
    edit([&](PlayQueue& queue) { return queue.remove(*coreItem(item.get())); });
}

void CoreQueuePlayer::removeAllItems() {
    edit([](PlayQueue& queue) { return queue.removeAll(); });
}

void CoreQueuePlayer::replaceCurrentItem(std::shared_ptr<MediaItem> item) {
    bool replaced = true;
    edit([&](PlayQueue& queue) {
        auto current = queue.current();
        if (current == item)
            return PlayQueue::Entries();
        replaced = queue.insert(coreItem(std::move(item)), current.get());
        return replaced && current ? queue.removeFirst() : PlayQueue::Entries();
    });
    if (!replaced)
        reportDuplicate("-[MediaQueuePlayer replaceCurrentItemWithPlayerItem:]");
}

void CoreQueuePlayer::setAudioSession(AudioSession& session) {
    auto handler = [weak = weak_from_this()](const Notification& notification) {
        auto type = notification.info.find(AudioSession::interruptionTypeKey);
        auto player = weak.lock();
        if (player && type != notification.info.end() && type->second == AudioSession::interruptionBegan)
            player->interruptionBegan();
    };
    auto subscription = environment_.notifications.addObserver(AudioSession::interruptionNotification,
                                                               &session, std::move(handler));
    EngineLock lock(environment_);
    session_ = &session;
    std::swap(interruptions_, subscription); // the one before ends behind the lock
}

AudioSession* CoreQueuePlayer::audioSession() const {
    EngineLock lock(environment_);
    return session_;
}

} // namespace tarn
