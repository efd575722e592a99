#pragma once

#include <memory>
#include <optional>

#include "roles/Error.h"
#include "roles/MediaItem.h"
#include "roles/MediaTime.h"
#include "roles/Observable.h"
#include "roles/PlaybackState.h"

namespace tarn {

class AudioSession;

/// Plays a queue of items; the first one is current. Observable: "status" (std::int64_t), "rate" (float),
/// "currentItem" (item).
///
/// Any thread may call, and what a call changes is to be read back at once; sound follows. The changes that a
/// call makes are reported on its thread before it returns, unless another thread is reporting that property
/// just then and goes on with them; those of playing itself (an item ends or fails) on the player thread.
/// Letting the last reference go, on any thread, silences the player without waiting for it.
///
/// An item that ends leaves the queue, and it is reported in this order: the item's status if it failed, its
/// notification, "currentItem", and "rate" if the queue is empty then and the rate has become 0. Playing
/// backwards ends at the start of the current item, which stays: only "rate" is reported. The rate stays
/// through every edit, also when it empties the queue. An item that the player cannot open fails as soon as
/// that is known, at the latest when it becomes current.
class MediaQueuePlayer : public Observable {
public:
    static constexpr char statusKeyPath[] = "status";
    static constexpr char rateKeyPath[] = "rate";
    static constexpr char currentItemKeyPath[] = "currentItem";

    /// A notification with this player as its sender: rate, queue or position have changed, and the sound has
    /// followed. Posted on the player thread; changes that come close together share one.
    static constexpr char playbackDidChange[] = "MediaQueuePlayerPlaybackChanged";

    virtual MediaStatus status() const = 0;

    /// Why nothing is heard though the status is ready: there was nothing to sound on when the player was to
    /// play; sound goes nowhere while it plays; or its device is gone and it was paused. None once that is
    /// over, or the player plays again. Every change is reported as one of "status", before the change of the
    /// rate that comes with it.
    virtual std::optional<Error> error() const = 0;

    /// Has error() say why this player could not begin to sound.
    virtual void soundFailed(const Error& error) = 0;

    /// Exactly what was set: 0 is paused, below 0 plays backwards.
    virtual float rate() const = 0;

    /// A rate that is not finite is refused with one error line: the rate stays.
    virtual void setRate(float rate) = 0;
    virtual void pause() = 0;

    /// Plays on: at the rate at which an interruption paused this player, else at 1.0. A player that was told
    /// to pause after the interruption had paused it stays paused, once: whoever pauses during a call does
    /// not want to hear it afterwards. One that was paused because its device is gone stays paused until a
    /// rate is set.
    virtual void play() = 0;

    /// None when the queue is empty.
    virtual std::shared_ptr<MediaItem> currentItem() const = 0;

    /// The current item's; zero when there is none.
    virtual MediaTime currentTime() const = 0;

    /// Rate, current item and all the rest of one moment.
    virtual PlaybackState playback() const = 0;

    virtual void advanceToNextItem() = 0;

    /// Inserts behind `after`, or at the end of the queue when `after` is none. An item stands in a queue
    /// once: inserting it again is refused with one error line.
    virtual void insertItem(std::shared_ptr<MediaItem> item, const std::shared_ptr<MediaItem>& after) = 0;

    /// Removing the current item goes on with the next one. An item that is not in the queue is ignored.
    virtual void removeItem(const std::shared_ptr<MediaItem>& item) = 0;
    virtual void removeAllItems() = 0;

    /// In an empty queue the item becomes the current one.
    virtual void replaceCurrentItem(std::shared_ptr<MediaItem> item) = 0;

    virtual void setAudioSession(AudioSession& session) = 0;

    /// The session that it was bound to; null before.
    virtual AudioSession* audioSession() const = 0;
};

} // namespace tarn
