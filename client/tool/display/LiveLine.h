#pragma once

#include <string>

namespace tarn::tool {

/// What the live line shows.
struct LiveState {
    std::string place; // in the list: "3/12"; empty when there is one track alone
    std::string title;
    std::string artist; // may be empty
    double position = 0;
    double duration = 0;
    bool isPaused = false;
    float rate = 1; // while it is paused: the rate at which it will go on
};

/// The line for a terminal of that many columns, without the last one: "> 3/12 Title - Artist  1:23 / 4:56
/// [====    ] 1.5x". What does not fit is left out, least important first: bar, artist, place, a part of the
/// title.
std::string liveLine(const LiveState& state, int columns, bool color);

} // namespace tarn::tool
