#include "player/PlaybackQueuePlayer.h"

#include <cassert>
#include <cmath>
#include <utility>

#include "log/SystemLog.h"
#include "player/MediaTimes.h"
#include "player/PlaybackItem.h"
#include "roles/AudioSession.h"
#include "roles/NotificationCenter.h"

namespace tarn {

namespace {

std::shared_ptr<PlaybackItem> playbackItem(std::shared_ptr<MediaItem> item) {
    assert(dynamic_cast<PlaybackItem*>(item.get()) && "an item of another engine");
    return std::static_pointer_cast<PlaybackItem>(std::move(item));
}

const PlaybackItem* playbackItem(const MediaItem* item) { return static_cast<const PlaybackItem*>(item); }

void reportDuplicate(std::string_view method) {
    SystemLog::error(method, __LINE__, "%{public}s:%d: Refused an item that is in the queue already.");
}

} // namespace

std::shared_ptr<PlaybackQueuePlayer>
PlaybackQueuePlayer::create(PlayerEnvironment& environment, std::vector<std::shared_ptr<MediaItem>> items) {
    auto player = std::make_shared<PlaybackQueuePlayer>(environment);
    player->playback_->setListener(player);
    for (auto& item : items)
        player->insertItem(std::move(item), nullptr);
    return player;
}

PlaybackQueuePlayer::PlaybackQueuePlayer(PlayerEnvironment& environment)
    : environment_(environment),
      playback_(std::make_shared<Playback>(environment)),
      observers_(*this, [](const Observable& object, std::string_view keyPath) {
          return static_cast<const PlaybackQueuePlayer&>(object).read(keyPath);
      }) {}

PlaybackQueuePlayer::~PlaybackQueuePlayer() { playback_->close(); }

RegistrationHandle PlaybackQueuePlayer::observe(std::string_view keyPath, Block block) {
    return observers_.observe(keyPath, std::move(block));
}

ObservedValue PlaybackQueuePlayer::read(std::string_view keyPath) const {
    if (keyPath == rateKeyPath)
        return rate();
    if (keyPath == currentItemKeyPath)
        return currentItem();
    assert(keyPath == statusKeyPath);
    return static_cast<std::int64_t>(status());
}

float PlaybackQueuePlayer::rate() const {
    EngineLock lock(environment_);
    return playback_->queue().rate();
}

std::shared_ptr<MediaItem> PlaybackQueuePlayer::currentItem() const {
    EngineLock lock(environment_);
    return playback_->queue().current();
}

MediaTime PlaybackQueuePlayer::currentTime() const { return playback().position; }

PlaybackState PlaybackQueuePlayer::playback() const {
    EngineLock lock(environment_);
    const PlayQueue& queue = playback_->queue();
    PlaybackState state;
    state.rate = queue.rate();
    state.item = queue.current();
    if (state.item)
        state.position = mediaTimeOf(queue.positionOf(*queue.entries().front().item));
    state.hasNextItem = queue.entries().size() > 1;
    state.seeks = queue.seeks();
    return state;
}

// Whatever kept a paused player from sounding does not count any more when it plays again.
template <class Change>
void PlaybackQueuePlayer::changeRate(Change change) {
    bool changed = false;
    bool errorGone = false;
    {
        EngineLock lock(environment_);
        PlayQueue& queue = playback_->queue();
        const bool paused = queue.rate() == 0;
        changed = change(queue);
        errorGone = paused && queue.rate() != 0 && std::exchange(soundError_, std::nullopt).has_value();
    }
    if (errorGone)
        observers_.changed(statusKeyPath);
    if (changed)
        rateChanged();
}

void PlaybackQueuePlayer::setRate(float rate) {
    if (!std::isfinite(rate)) {
        SystemLog::error("-[MediaQueuePlayer setRate:]", __LINE__,
                         "%{public}s:%d: Refused a rate that is not finite: %f.", rate);
        return;
    }
    changeRate([rate](PlayQueue& queue) { return queue.setRate(rate); });
}

void PlaybackQueuePlayer::pause() {
    changeRate([](PlayQueue& queue) { return queue.setRate(0); });
}

void PlaybackQueuePlayer::play() {
    changeRate([](PlayQueue& queue) { return queue.play(); });
}

void PlaybackQueuePlayer::interruptionBegan() {
    changeRate([](PlayQueue& queue) { return queue.interrupt(); });
}

void PlaybackQueuePlayer::playbackChanged() {
    environment_.notifications.post({.name = MediaQueuePlayer::playbackDidChange,
                                     .sender = static_cast<MediaQueuePlayer*>(this),
                                     .info = {}});
}

std::optional<Error> PlaybackQueuePlayer::error() const {
    EngineLock lock(environment_);
    return soundError_;
}

void PlaybackQueuePlayer::soundChanged(const std::optional<Error>& error) {
    {
        EngineLock lock(environment_);
        if (std::exchange(soundError_, error) == error)
            return;
    }
    observers_.changed(statusKeyPath);
}

// The reason is told before the pause, so that nobody takes that for the listener's.
void PlaybackQueuePlayer::deviceVanished(const Error& error) {
    bool wasPlaying = false;
    {
        EngineLock lock(environment_);
        wasPlaying = playback_->queue().rate() != 0;
        if (!playback_->queue().loseDevice())
            return;
        soundError_ = error;
    }
    SystemLog::message("-[MediaQueuePlayer deviceVanished]", __LINE__,
                       "%{public}s:%d: Paused: the device that played is gone.");
    observers_.changed(statusKeyPath);
    if (wasPlaying)
        rateChanged();
}

template <class Edit>
void PlaybackQueuePlayer::edit(Edit edit) {
    PlayQueue::Entries left; // outlives the lock
    bool changed = false;
    {
        EngineLock lock(environment_);
        PlayQueue& queue = playback_->queue();
        const PlaybackItem* before = queue.current().get(); // kept alive by `left`
        left = edit(queue);
        changed = queue.current().get() != before;
    }
    if (changed)
        currentItemChanged();
}

void PlaybackQueuePlayer::advanceToNextItem() {
    edit([](PlayQueue& queue) { return queue.removeFirst(); });
}

void PlaybackQueuePlayer::insertItem(std::shared_ptr<MediaItem> item,
                                     const std::shared_ptr<MediaItem>& after) {
    bool inserted = false;
    edit([&](PlayQueue& queue) {
        inserted = queue.insert(playbackItem(std::move(item)), playbackItem(after.get()));
        return PlayQueue::Entries();
    });
    if (!inserted)
        reportDuplicate("-[MediaQueuePlayer insertItem:afterItem:]");
}

void PlaybackQueuePlayer::removeItem(const std::shared_ptr<MediaItem>& item) {
    edit([&](PlayQueue& queue) { return queue.remove(*playbackItem(item.get())); });
}

void PlaybackQueuePlayer::removeAllItems() {
    edit([](PlayQueue& queue) { return queue.removeAll(); });
}

void PlaybackQueuePlayer::replaceCurrentItem(std::shared_ptr<MediaItem> item) {
    bool replaced = true;
    edit([&](PlayQueue& queue) {
        auto current = queue.current();
        if (current == item)
            return PlayQueue::Entries();
        replaced = queue.insert(playbackItem(std::move(item)), current.get());
        return replaced && current ? queue.removeFirst() : PlayQueue::Entries();
    });
    if (!replaced)
        reportDuplicate("-[MediaQueuePlayer replaceCurrentItemWithPlayerItem:]");
}

void PlaybackQueuePlayer::setAudioSession(AudioSession& session) {
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

AudioSession* PlaybackQueuePlayer::audioSession() const {
    EngineLock lock(environment_);
    return session_;
}

} // namespace tarn
