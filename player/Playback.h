#pragma once

#include <array>
#include <cstddef>
#include <memory>
#include <optional>

#include "player/EndTimer.h"
#include "player/OpenRenderings.h"
#include "player/Output.h"
#include "player/PlayQueue.h"
#include "player/PlayerEnvironment.h"
#include "threads/LiveObjects.h"

namespace tarn {

/// Is told by a playback what playing has changed. Called on the player thread without the mutex.
class PlaybackListener {
public:
    virtual ~PlaybackListener() = default;
    virtual void currentItemChanged() = 0;
    virtual void rateChanged() = 0;
    virtual void deviceVanished(const Error& error) = 0;
    virtual void soundChanged(const std::optional<Error>& error) = 0;

    /// The sound has followed one or more changes of rate, queue or position.
    virtual void playbackChanged() = 0;
};

/// Turns a PlayQueue into sound.
///
/// Every change of the queue, every report of the output, of a rendering or of the timer leads to one run()
/// on the player thread, which does what is to be done now, whatever led to it: reports what has ended, opens
/// the current item, starts or stops the output, takes back what is not to be heard any more, renders a piece
/// and comes back for the next one, opens the next item when the output is full. Without such a cause nothing
/// runs. The pieces are short, so that a pause never waits for a whole buffer.
class Playback final : public OutputListener, public std::enable_shared_from_this<Playback> {
public:
    explicit Playback(PlayerEnvironment& environment);

    /// Before the first change of the queue.
    void setListener(std::weak_ptr<PlaybackListener> listener) { listener_ = std::move(listener); }

    /// Any thread, under the environment's mutex.
    PlayQueue& queue() { return queue_; }

    /// Any thread: ends playing for good. The sound stops as soon as the player thread gets to it; the caller
    /// does not wait.
    void close();

private:
    struct Place {
        EntryId entry = 0;
        std::shared_ptr<PlaybackItem> item;
    };

    void outputIsWritable() override { scheduleLocking(); }
    void outputWasReset() override { scheduleLocking(); }
    void outputClockMoved() override { scheduleLocking(); }
    void outputDeviceVanished(const Error& error) override;
    void outputSoundChanged(const std::optional<Error>& error) override;

    void schedule();
    void scheduleLocking();
    void run();
    void shutDown();
    void reportEnds();
    void report(const PlayQueue::Ending& ending);
    std::array<Place, 2> places();
    bool openPlace(std::size_t index);
    std::optional<Error> open(const Place& place);
    bool prepareOutput();
    bool renderPiece();
    void append(const PlayQueue::Head& head, RenderedSpan span);
    void startOutput();
    void stopOutput();
    void setTimer();
    void tellOfChange();

    PlayerEnvironment& environment_;
    std::weak_ptr<PlaybackListener> listener_;

    // Under the mutex.
    PlayQueue queue_;
    bool scheduled_ = false;
    bool queueChanged_ = false; // and the listener has not been told that the sound followed
    bool closed_ = false;

    // On the player thread.
    OpenRenderings renderings_;
    std::unique_ptr<Output> output_;
    bool sounding_ = false;
    EntryId described_ = 0;
    PcmBuffer buffer_;
    EndTimer timer_;
    LiveObject<"playback"> live_;
};

} // namespace tarn
