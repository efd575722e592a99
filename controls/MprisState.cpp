#include "controls/MprisState.h"

#include <cmath>

#include "controls/BusText.h"

namespace tarn {

namespace {

using std::chrono::microseconds;

/// Below it, a rate counts as zero.
constexpr float rateThreshold = 0x1p-23F;

constexpr microseconds jumpTolerance = std::chrono::milliseconds(500);
constexpr microseconds restartDistance = std::chrono::seconds(1);
constexpr double longestSeconds = 1e9;

std::optional<microseconds> microsecondsFrom(const std::optional<double>& seconds) {
    if (!seconds || !(*seconds > 0))
        return std::nullopt;
    return microseconds(std::llround(std::fmin(*seconds, longestSeconds) * 1e6));
}

std::optional<std::string> shownText(const std::optional<std::string>& text) {
    return text ? std::optional(busText(*text)) : std::nullopt;
}

float usableRate(const NowPlayingInfo& info) {
    const float rate = info.playbackRate.value_or(0);
    return std::isfinite(rate) && std::fabs(rate) >= rateThreshold ? rate : 0;
}

bool isAnotherItem(const MprisState& before, const MprisState& after) {
    if (!before.track || before.application != after.application)
        return true;
    MprisTrack described = *after.track;
    described.number = before.track->number;
    if (described != *before.track)
        return true;
    const PositionLine::Time time = after.position.start();
    const microseconds elapsed = after.position.at(time);
    return elapsed <= jumpTolerance && before.position.at(time) - elapsed > restartDistance;
}

bool isJump(const MprisState& before, const MprisState& after) {
    if (!after.track)
        return false;
    const bool sameTrack = before.track && before.track->number == after.track->number;
    const PositionLine::Time time = after.position.start();
    const microseconds expected = sameTrack ? before.position.at(time) : microseconds::zero();
    return std::chrono::abs(after.position.at(time) - expected) > jumpTolerance;
}

} // namespace

MprisState MprisState::next(const Publication& publication) const {
    MprisState after;
    after.application = publication.application;
    after.lastTrackNumber = lastTrackNumber;
    const NowPlayingInfo& info = publication.info;
    if (info.empty())
        return after;

    const float published = usableRate(info);
    const bool playing = published != 0;
    after.playbackStatus = playing ? PlaybackStatus::playing : PlaybackStatus::paused;
    after.rate = playing ? static_cast<double>(published) : 1.0;
    after.track = MprisTrack{.title = shownText(info.title),
                             .artist = shownText(info.artist),
                             .album = shownText(info.albumTitle),
                             .length = microsecondsFrom(info.duration)};
    after.position = PositionLine(microsecondsFrom(info.elapsedTime).value_or(microseconds::zero()),
                                  publication.time, static_cast<double>(published), after.track->length);
    if (isAnotherItem(*this, after))
        ++after.lastTrackNumber;
    after.track->number = after.lastTrackNumber;
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
    note(changes.player, "CanGoNext", controlChanged);
    note(changes.player, "CanPlay", controlChanged);
    note(changes.player, "CanPause", controlChanged);
    if (isJump(before, after))
        changes.seeked = after.position.at(after.position.start());
    return changes;
}

} // namespace tarn
