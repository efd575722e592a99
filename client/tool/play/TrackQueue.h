#pragma once

#include <cstddef>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "client/tool/play/PlayOrder.h"
#include "client/tool/play/Track.h"

namespace tarn::tool {

/// Keeps the service's queue player filled from a list that may be long: the service knows the track that
/// plays, some behind it, and none of the rest.
///
/// A track is opened as an asset, becomes an item, and stands in the queue player behind those before it. The
/// first one makes the queue player, and is all that the service is asked for until then, so that it sounds
/// soon. A file that cannot be opened gives way to the next one.
///
/// Everything is asked for without waiting, and goes on in the handlers of the client: for the thread that
/// calls its drainEvents().
class TrackQueue {
public:
    struct Listener {
        std::function<void()> begins; ///< the queue player is made, and paused at the first track
        std::function<void(const std::string& path, const std::string& reason)> refused;
        std::function<void(const std::string& problem)> failed; ///< there can be no queue player
    };

    TrackQueue(client::Client& client, std::string player, std::vector<std::string> files,
               PlayOrder::Options order, Access access, Listener listener);

    /// Asks for the tracks that are missing.
    void fill();

    /// The track that plays now, by its item; none when the queue player is empty. What lies behind is
    /// forgotten.
    std::optional<Track> goOnTo(const std::optional<std::string>& item);

    /// Goes on to the next track, also when the service does not know it yet. Each call counts.
    void skip();

    /// Is there nothing behind the track that plays or has played last?
    bool isAtEnd() const { return isExhausted_ && reached_ == tracks_.size(); }
    std::size_t size() const { return order_.size(); }
    /// The path of a track that plays or has just played.
    const std::string* pathOf(const std::string& item) const;
    /// It could not be played to its end, and is not played again.
    void leaveOut(const std::string& item);

private:
    struct Entry {
        Track track;
        bool isItem = false;
    };
    using Entries = std::deque<Entry>;

    bool openNext();
    void takeAsset(const std::string& identifier, const client::Result<client::AssetInfo>& result);
    void takeItem(const std::string& identifier, const client::Completion& result);
    void refuse(Entries::iterator entry, const std::string& reason);
    void queueWhatIsReady();
    void makePlayer(const std::string& item);
    void skipWhatIsQueued();
    void forgetBehind(std::size_t index);
    Entries::iterator find(const std::string& identifier);

    client::Client& client_;
    const std::string player_;
    const std::vector<std::string> files_;
    PlayOrder order_;
    const Access access_;
    const Listener listener_;

    Entries tracks_;           // in their order: those in the queue player come first
    std::size_t inQueue_ = 0;  // of them, also those that have played
    std::size_t reached_ = 0;  // of these: have played, or play when all skips that were sent are carried out
    std::size_t skips_ = 0;    // not sent yet, for want of a track to go on to
    std::size_t opened_ = 0;   // since the beginning
    bool hasPlayer_ = false;   // at least asked for
    bool hasBegun_ = false;    // it is there
    bool isExhausted_ = false; // every file has had its turn
};

} // namespace tarn::tool
