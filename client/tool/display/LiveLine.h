#pragma once

#include <string>

namespace tarn::tool {

/// What the live line shows.
struct LiveState {
    std::string title;
    std::string artist; // may be empty
    double position = 0;
    double duration = 0;
    float rate = 0;
};

/// The line for a terminal of that many columns, without the last one: "> Title - Artist  1:23 / 4:56
/// [====    ] 1.5x". What does not fit is left out, least important first: bar, artist, a part of the title.
std::string liveLine(const LiveState& state, int columns, bool color);

} // namespace tarn::tool
