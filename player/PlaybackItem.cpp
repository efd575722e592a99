#include "player/PlaybackItem.h"

#include <algorithm>
#include <cassert>
#include <utility>

#include "log/SystemLog.h"
#include "player/MediaTimes.h"
#include "player/PlayQueue.h"
#include "roles/MediaAsset.h"
#include "roles/NotificationCenter.h"

namespace tarn {

PlaybackItem::PlaybackItem(PlayerEnvironment& environment, std::shared_ptr<MediaAsset> asset)
    : environment_(environment),
      asset_(std::move(asset)),
      observers_(*this, [](const Observable& object, std::string_view keyPath) {
          return static_cast<const PlaybackItem&>(object).read(keyPath);
      }) {}

RegistrationHandle PlaybackItem::observe(std::string_view keyPath, Block block) {
    return observers_.observe(keyPath, std::move(block));
}

MediaStatus PlaybackItem::status() const {
    EngineLock lock(environment_);
    return state_.status;
}

std::optional<Error> PlaybackItem::error() const {
    EngineLock lock(environment_);
    return state_.error ? std::optional(*state_.error) : std::nullopt;
}

MediaTime PlaybackItem::currentTime() const {
    EngineLock lock(environment_);
    return mediaTimeOf(state_.driver ? state_.driver->positionOf(*this) : state_.position);
}

void PlaybackItem::seekToTime(MediaTime time) {
    if (!time.isNumeric()) {
        SystemLog::error("-[MediaItem seekToTime:]", __LINE__,
                         "%{public}s:%d: Refused to seek to a time that is not a number.");
        return;
    }
    auto position = std::max(nanosecondsOf(time), std::chrono::nanoseconds(0));
    if (MediaTime duration = asset_->duration(); duration.isNumeric())
        position = std::min(position, nanosecondsOf(duration));
    {
        EngineLock lock(environment_);
        state_.playedToEnd = false;
        if (state_.driver)
            state_.driver->seek(*this, position);
        else
            state_.position = position;
    }
    post(timeJumped);
}

void PlaybackItem::becomeReady() {
    {
        EngineLock lock(environment_);
        if (state_.status != MediaStatus::unknown)
            return;
        state_.status = MediaStatus::readyToPlay;
    }
    reportStatus();
}

void PlaybackItem::post(std::string_view notification) {
    environment_.notifications.post(
        {.name = notification, .sender = static_cast<MediaItem*>(this), .info = {}});
}

ObservedValue PlaybackItem::read([[maybe_unused]] std::string_view keyPath) const {
    assert(keyPath == statusKeyPath);
    return static_cast<std::int64_t>(status());
}

} // namespace tarn
