#pragma once

#include <optional>
#include <string>

#include "wire/Dictionary.h"

namespace tarn::tool {

/// What a media player on the session bus said of itself at one moment.
struct PlayerStatus {
    enum class State { stopped, paused, playing };

    State state = State::stopped;
    std::string application; ///< whose music it is, for a person; may be empty, like all texts here
    std::string title;
    std::string artist;
    std::string album;
    std::string trackPath; ///< names the track on the bus
    double position = 0;   ///< seconds
    std::optional<double> duration;
    double rate = 1; ///< while it is paused: the rate at which "play" goes on
    double slowestRate = 1;
    double fastestRate = 1;
    double volume = 1; ///< 1 is as recorded
    bool canSeek = false;
    bool canGoNext = false;

    bool hasTrack() const { return state != State::stopped; }
    /// Do both tell a person the same? The position runs on by itself and does not count.
    bool looksLike(const PlayerStatus& other) const;
};

/// One line: "Playing A song - Somebody (1:23 of 4:56, 1.5x)".
std::string statusLine(const PlayerStatus& status);

/// The same for programs. Texts and times that are not known are left out.
Dictionary statusFields(const PlayerStatus& status);

} // namespace tarn::tool
