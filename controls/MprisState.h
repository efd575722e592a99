#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "controls/PositionLine.h"
#include "roles/NowPlayingService.h"

namespace tarn {

/// How an application appears in a media control.
struct ApplicationLabel {
    std::string identity;     // its name for a person, never empty
    std::string desktopEntry; // its installed desktop entry without ".desktop"; empty when it has none

    bool operator==(const ApplicationLabel&) const = default;
};

/// What was published last, when, and on whose behalf.
struct Publication {
    NowPlayingInfo info;
    PositionLine::Time time;
    ApplicationLabel application;
};

enum class PlaybackStatus { stopped, paused, playing };

/// What is shown of a track.
struct MprisTrack {
    std::uint64_t number = 0; // makes the track id: no two tracks of a process share one
    std::optional<std::string> title;
    std::optional<std::string> artist;
    std::optional<std::string> album;
    std::optional<std::chrono::microseconds> length;

    bool operator==(const MprisTrack&) const = default;
};

/// Everything that the player shows on the session bus, at one moment. A plain value: next() makes it,
/// changesBetween() compares it, MprisObject hands it out.
struct MprisState {
    ApplicationLabel application;
    PlaybackStatus playbackStatus = PlaybackStatus::stopped;
    double rate = 1.0; // never 0: while nothing plays, the rate that Play will play at
    std::optional<MprisTrack> track;
    PositionLine position;
    std::uint64_t lastTrackNumber = 0;

    /// Play, Pause and Next have something to act on. Going back and seeking are never possible.
    bool hasTrack() const { return track.has_value(); }

    /// The range of `rate`. No control can choose another one, so that it is no wider than it must be.
    double minimumRate() const { return rate < 1.0 ? rate : 1.0; }
    double maximumRate() const { return rate > 1.0 ? rate : 1.0; }

    /// The state that a publication leads to.
    ///
    /// A publication does not say whether its item is the one of the publication before. It counts as another
    /// item, with a track id of its own, when the texts, the length or the application differ, and when the
    /// same ones begin again: the position is back at the start after it had gone on from there.
    MprisState next(const Publication& publication) const;
};

/// What to tell the listeners.
struct MprisChanges {
    std::vector<std::string> application; // names of changed properties of org.mpris.MediaPlayer2
    std::vector<std::string> player;      // and of org.mpris.MediaPlayer2.Player
    std::optional<std::chrono::microseconds> seeked;

    bool operator==(const MprisChanges&) const = default;
};

/// A position counts as a jump when it is more than half a second off the line of the state before; a new
/// track is expected at its start.
MprisChanges changesBetween(const MprisState& before, const MprisState& after);

} // namespace tarn
