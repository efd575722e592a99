#pragma once

#include <memory>
#include <vector>

#include "observation/ObserverList.h"
#include "player/Playback.h"
#include "roles/MediaQueuePlayer.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// The queue player of every engine: what can be asked of it and what it reports. Its PlayQueue decides, its
/// Playback plays.
class PlaybackQueuePlayer final : public MediaQueuePlayer,
                                  public PlaybackListener,
                                  public std::enable_shared_from_this<PlaybackQueuePlayer> {
public:
    /// A paused player of `items`; an item that is among them twice is refused the second time.
    static std::shared_ptr<PlaybackQueuePlayer> create(PlayerEnvironment& environment,
                                                       std::vector<std::shared_ptr<MediaItem>> items);
    explicit PlaybackQueuePlayer(PlayerEnvironment& environment);
    ~PlaybackQueuePlayer() override;

    RegistrationHandle observe(std::string_view keyPath, Block block) override;

    /// Always ready to play: what fails are its items, and error() says what becomes of the sound.
    MediaStatus status() const override { return MediaStatus::readyToPlay; }
    std::optional<Error> error() const override;
    void soundFailed(const Error& error) override { soundChanged(error); }

    float rate() const override;
    void setRate(float rate) override;
    void pause() override;
    void play() override;
    std::shared_ptr<MediaItem> currentItem() const override;
    MediaTime currentTime() const override;
    PlaybackState playback() const override;
    void advanceToNextItem() override;
    void insertItem(std::shared_ptr<MediaItem> item, const std::shared_ptr<MediaItem>& after) override;
    void removeItem(const std::shared_ptr<MediaItem>& item) override;
    void removeAllItems() override;
    void replaceCurrentItem(std::shared_ptr<MediaItem> item) override;
    void setAudioSession(AudioSession& session) override;
    AudioSession* audioSession() const override;

private:
    void currentItemChanged() override { observers_.changed(currentItemKeyPath); }
    void rateChanged() override { observers_.changed(rateKeyPath); }
    void deviceVanished(const Error& error) override;
    void soundChanged(const std::optional<Error>& error) override;
    void playbackChanged() override;

    ObservedValue read(std::string_view keyPath) const;
    void interruptionBegan();

    /// Changes the rate, and reports when that says that it has changed.
    template <class Change>
    void changeRate(Change change);

    /// Edits the queue, and reports when another item is current then. What the edit returns leaves.
    template <class Edit>
    void edit(Edit edit);

    PlayerEnvironment& environment_;
    const std::shared_ptr<Playback> playback_;
    ObserverList observers_;
    AudioSession* session_ = nullptr; // under the mutex
    std::optional<Error> soundError_; // under the mutex
    RegistrationHandle interruptions_;
    LiveObject<"media queue player"> live_;
};

} // namespace tarn
