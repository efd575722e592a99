#pragma once

#include <string>
#include <vector>

#include "client/tool/play/Playback.h"

namespace tarn::tool {

struct PlayOptions {
    std::string socketPath;
    std::vector<std::string> names; ///< files, folders, playlists, URLs; "-" for a list on standard input
    Playback::Options playback;
    bool isDetached = false;
};

/// Plays files one after the other until the last one ends or somebody quits, and shows it; detached, until
/// they sound. Returns the exit status: 1 when something was not played, 128 and the number of a signal that
/// ended it. Throws Problem.
int runPlay(const PlayOptions& options);

} // namespace tarn::tool
