#pragma once

#include <string>
#include <vector>

#include "client/tool/play/Tracks.h"

namespace tarn::tool {

struct PlayOptions {
    std::string socketPath;
    std::vector<std::string> paths;
    float rate = 1;
    double from = 0; // seconds into the first file
    Access access = Access::service;
};

/// Plays files one after the other until the last one ends or somebody quits, and shows it. Returns the exit
/// status: 1 when something was not played, 128 and the number of a signal that ended it.
int runPlay(const PlayOptions& options);

} // namespace tarn::tool
