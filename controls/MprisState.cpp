#include "controls/MprisState.h"

#include <cmath>

#include "controls/BusText.h"

namespace tarn {

namespace {

using std::chrono::microseconds;

constexpr microseconds startTolerance = std::chrono::milliseconds(500);
constexpr double longestSeconds = 1e9;

microseconds microsecondsOf(double seconds) {
    return microseconds(seconds > 0 ? std::llround(std::fmin(seconds, longestSeconds) * 1e6) : 0);
}

std::optional<std::string> shownText(const std::optional<std::string>& text) {
    return text ? std::optional(busText(*text)) : std::nullopt;
}

template <class Object>
bool isSame(const std::weak_ptr<Object>& one, const std::weak_ptr<Object>& other) {
    return !one.owner_before(other) && !other.owner_before(one);
}

bool isSameItem(const MprisState& before, const MprisState& after) {
    return isSame(before.player, after.player) && isSame(before.item, after.item);
}

MprisTrack trackOf(const NowPlayingInfo& published, std::uint64_t number) {
    MprisTrack track{.number = number,
                     .title = shownText(published.title),
                     .artist = shownText(published.artist),
                     .album = shownText(published.albumTitle),
                     .length = {}};
    if (const auto length = microsecondsOf(published.duration.value_or(0)); length.count() > 0)
        track.length = length;
    return track;
}

} // namespace

microseconds microsecondsOf(const MediaTime& time) { return microsecondsOf(time.seconds()); }

MprisState MprisState::next(const NowPlayingInfo& published, const ApplicationLabel& label,
                            const ListedPlayer& shown) const {
    MprisState after;
    after.application = label;
    after.lastTrackNumber = lastTrackNumber;
    after.player = shown.player;
    after.seeks = shown.playback.seeks;
    if (!shown.playback.item)
        return after;

    const bool plays = shown.playback.plays();
    after.playbackStatus = plays ? PlaybackStatus::playing : PlaybackStatus::paused;
    after.rate = plays ? static_cast<double>(shown.playback.rate) : 1.0;
    after.canGoNext = shown.playback.hasNextItem;
    after.position = microsecondsOf(shown.playback.position);
    after.item = shown.playback.item;
    after.track = trackOf(published, lastTrackNumber);
    if (track != after.track || application != label || !isSameItem(*this, after))
        after.track->number = ++after.lastTrackNumber;
    return after;
}

MprisChanges changesBetween(const MprisState& before, const MprisState& after) {
    MprisChanges changes;
    const auto note = [](std::vector<std::string>& names, const char* name, bool changed) {
        if (changed)
            names.emplace_back(name);
    };
    note(changes.application, "Identity", before.application.identity != after.application.identity);
    note(changes.application, "DesktopEntry",
         before.application.desktopEntry != after.application.desktopEntry);

    // Some listeners ask for the status again whenever the metadata come without it.
    const bool trackChanged = before.track != after.track;
    const bool controlChanged = before.hasTrack() != after.hasTrack();
    note(changes.player, "PlaybackStatus", trackChanged || before.playbackStatus != after.playbackStatus);
    note(changes.player, "Rate", before.rate != after.rate);
    note(changes.player, "MinimumRate", before.minimumRate() != after.minimumRate());
    note(changes.player, "MaximumRate", before.maximumRate() != after.maximumRate());
    note(changes.player, "Metadata", trackChanged);
    note(changes.player, "CanGoNext", before.canGoNext != after.canGoNext);
    note(changes.player, "CanPlay", controlChanged);
    note(changes.player, "CanPause", controlChanged);
    note(changes.player, "CanSeek", controlChanged);
    const bool moved =
        isSameItem(before, after) ? before.seeks != after.seeks : after.position > startTolerance;
    if (after.hasTrack() && moved)
        changes.seeked = after.position;
    return changes;
}

} // namespace tarn
