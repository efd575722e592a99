#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <list>
#include <memory>
#include <optional>
#include <unordered_map>

#include "player/Output.h"
#include "player/PlaybackItem.h"
#include "player/Timeline.h"

namespace tarn {

/// The queue of one player, its rate, and what has been rendered of it: every decision of a queue player,
/// without sound or thread.
///
/// Edits change what is to be heard; reconcile() then says what of the frames that were rendered is to be
/// taken back, and head() what is to be rendered next. Everything is called under the environment's mutex.
class PlayQueue {
public:
    struct Entry {
        EntryId id;
        std::shared_ptr<PlaybackItem> item;
        std::chrono::nanoseconds position; ///< where it begins, or goes on, when no span tells
        bool moved;                        ///< a seek that has not been rendered yet
        PlayQueue* driverBefore;           ///< drives the item again when this queue lets it go, if any
    };

    /// Entries that have left the queue. To be destroyed after the mutex was let go.
    using Entries = std::list<Entry>;

    /// `changed` is called under the mutex when there may be something for the player thread to do.
    explicit PlayQueue(std::function<void()> changed) : changed_(std::move(changed)) {}

    // What the player shows.
    const Entries& entries() const { return entries_; }
    std::shared_ptr<PlaybackItem> current() const;
    float rate() const { return rate_; }
    std::chrono::nanoseconds positionOf(const PlaybackItem& item) const;

    /// How often the position of a current item was set.
    std::uint64_t seeks() const { return seeks_; }

    // Edits.
    /// Behind `after`, or at the end when it is null or not there. False when the item is in the queue
    /// already.
    [[nodiscard]] bool insert(std::shared_ptr<PlaybackItem> item, const PlaybackItem* after);
    [[nodiscard]] Entries remove(const PlaybackItem& item);
    [[nodiscard]] Entries removeFirst();
    [[nodiscard]] Entries removeAll();
    void seek(const PlaybackItem& item, std::chrono::nanoseconds position);

    /// All three say whether the rate changed.
    bool setRate(float rate);
    bool play();
    bool interrupt();

    /// Pauses what plays, or was paused by an interruption, until a rate is set. False when it does neither.
    bool loseDevice();

    // Rendering.
    bool playing() const { return rate_ != 0 && !entries_.empty(); }

    /// Whose clock says what is heard; null before there is one.
    void setClock(const Output* output) { clock_ = output; }

    struct Rewind {
        std::int64_t frame;
        Output::Join join;
    };

    /// Compares what is rendered with what is to be heard. The answer, if any, is what the output has to take
    /// back; nothing before `firstReplaceable` is. What the output has lost by itself lies behind
    /// `writeIndex`, where writing goes on.
    std::optional<Rewind> reconcile(std::int64_t firstReplaceable, std::int64_t writeIndex);

    struct Head {
        EntryId entry;
        std::chrono::nanoseconds position;
        float rate;
    };

    /// What is to be rendered behind all that has been; reaches into the second entry at most.
    std::optional<Head> head() const;

    void append(Timeline::Span span) { timeline_.append(std::move(span)); }

    // Ends.
    struct Ending {
        Entries left; ///< the entry that ended; none when playing backwards reached the start
        Timeline::End how = Timeline::End::completed;
        bool statusChanged = false;
        bool driven = false; ///< by this queue, so that it reports
        bool currentItemChanged = false;
        bool rateChanged = false;
    };

    /// The first entry leaves if its end has been heard; to be called until there is none. Nothing ends
    /// while paused.
    [[nodiscard]] std::optional<Ending> takeEnd();

    /// The frame whose hearing is the next end.
    std::optional<std::int64_t> nextEnd() const;

    /// An entry could not be opened: it leaves, wherever it stands. None when it has left already.
    [[nodiscard]] std::optional<Ending> fail(EntryId entry, const Error& error);

private:
    std::int64_t heard() const;
    Entries take(Entries::iterator entry);
    Ending end(Entries::iterator entry, Timeline::End how, const std::optional<Error>& error);
    void enter(Entry& entry);
    void leave(Entry& entry);
    std::optional<Rewind> dropDiverged(std::int64_t firstReplaceable);

    const std::function<void()> changed_;
    Entries entries_;
    std::unordered_map<const PlaybackItem*, Entries::iterator> byItem_;
    EntryId lastId_ = 0;
    std::uint64_t seeks_ = 0;
    float rate_ = 0;
    std::optional<float> interruptedRate_;
    bool staysPaused_ = false; ///< was told to pause after an interruption had paused it
    bool lostDevice_ = false;  ///< was paused for that, so that play() does not go on over another one
    Timeline timeline_;
    float renderedRate_ = 0; ///< the rate of what is rendered, 0 before anything was
    const Output* clock_ = nullptr;
    std::optional<std::int64_t> pausedFrame_; ///< heard when the rate became 0; stands until it is not
};

} // namespace tarn
