#pragma once

#include <chrono>
#include <memory>

#include "observation/ObserverList.h"
#include "player/PlayerEnvironment.h"
#include "roles/MediaItem.h"
#include "threads/LiveObjects.h"

namespace tarn {

class PlayQueue;

/// An item of every engine: what it knows of itself, and which queue knows its position.
///
/// A player may be replaced by another one that holds the same items. The queue that an item entered last
/// drives it: it alone tells its position and reports how it ends. When that one lets it go, the one before
/// drives it again.
class PlaybackItem final : public MediaItem {
public:
    PlaybackItem(PlayerEnvironment& environment, std::shared_ptr<MediaAsset> asset);

    RegistrationHandle observe(std::string_view keyPath, Block block) override;
    MediaStatus status() const override;
    std::optional<Error> error() const override;
    const std::shared_ptr<MediaAsset>& asset() const override { return asset_; }
    MediaTime currentTime() const override;
    void seekToTime(MediaTime time) override;

    struct State {
        MediaStatus status = MediaStatus::unknown;
        std::unique_ptr<const Error> error;   ///< null for most items, so it takes no place in them
        PlayQueue* driver = nullptr;          ///< the queue that it entered last, while it stands in it
        std::chrono::nanoseconds position{0}; ///< where playing goes on; up to date while no queue drives it
        bool playedToEnd = false;             ///< so it begins anew when it enters a queue again
    };

    /// To be used under the environment's mutex only.
    State& state() { return state_; }

    // To be called without the mutex.
    void becomeReady();
    void reportStatus() { observers_.changed(statusKeyPath); }
    void post(std::string_view notification);

private:
    ObservedValue read(std::string_view keyPath) const;

    PlayerEnvironment& environment_;
    const std::shared_ptr<MediaAsset> asset_;
    State state_;
    ObserverList observers_;
    LiveObject<"media item"> live_;
};

} // namespace tarn
