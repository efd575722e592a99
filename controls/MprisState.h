#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "controls/PlayerList.h"
#include "roles/NowPlayingService.h"

namespace tarn {

/// How an application appears in a media control.
struct ApplicationLabel {
    std::string identity;     // its name for a person, never empty
    std::string desktopEntry; // its installed desktop entry without ".desktop"; empty when it has none

    bool operator==(const ApplicationLabel&) const = default;
};

enum class PlaybackStatus : std::uint8_t { stopped, paused, playing };

/// What is shown of a track.
struct MprisTrack {
    std::uint64_t number = 0; // makes the track id: no two tracks of a process share one
    std::optional<std::string> title;
    std::optional<std::string> artist;
    std::optional<std::string> album;
    std::optional<std::chrono::microseconds> length;

    /// The track id.
    std::string path() const { return "/ostrel/tarnd/track/" + std::to_string(number); }

    bool operator==(const MprisTrack&) const = default;
};

/// Everything that the player shows on the session bus, at one moment. A plain value: next() makes it,
/// changesBetween() compares it, MprisObject hands it out.
///
/// It has two sources. What the track is called, and on whose behalf it plays, is what was published last.
/// What is done with it (status, rate, position, and what a button would do) is what the queue player does
/// that the buttons act on. Nearly always the two speak of the same track.
struct MprisState {
    /// No control can choose a rate beyond: nothing would be heard of it.
    static constexpr double slowestRate = 1.0 / 32;
    static constexpr double fastestRate = 32;

    ApplicationLabel application;
    PlaybackStatus playbackStatus = PlaybackStatus::stopped;
    double rate = 1.0; // never 0: while nothing plays, the rate that Play will play at
    bool canGoNext = false;
    std::optional<MprisTrack> track; // none: there is nothing to act on
    std::chrono::microseconds position{0};
    std::uint64_t lastTrackNumber = 0;

    std::weak_ptr<ControllablePlayer> player; // that the buttons act on
    std::weak_ptr<MediaItem> item;            // its current one
    std::uint64_t seeks = 0;                  // of that player

    bool hasTrack() const { return track.has_value(); }

    /// The range of `rate`: forwards, but for a rate that a client has set.
    double minimumRate() const { return rate < slowestRate ? rate : slowestRate; }
    double maximumRate() const { return rate > fastestRate ? rate : fastestRate; }

    /// The state after this one. A track gets a number of its own when the item or what is published of it is
    /// another one than before.
    MprisState next(const NowPlayingInfo& published, const ApplicationLabel& label,
                    const ListedPlayer& shown) const;
};

/// What to tell the listeners.
struct MprisChanges {
    std::vector<std::string> application; // names of changed properties of org.mpris.MediaPlayer2
    std::vector<std::string> player;      // and of org.mpris.MediaPlayer2.Player
    std::optional<std::chrono::microseconds> seeked;

    bool operator==(const MprisChanges&) const = default;
};

/// A position is told of when it was set, and when another item begins more than half a second from its
/// start.
MprisChanges changesBetween(const MprisState& before, const MprisState& after);

/// The time as MPRIS has it: never below zero.
std::chrono::microseconds microsecondsOf(const MediaTime& time);

} // namespace tarn
