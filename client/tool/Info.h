#pragma once

#include <string>
#include <vector>

#include "client/tool/play/Track.h"

namespace tarn::tool {

struct InfoOptions {
    std::string socketPath;
    std::vector<std::string> paths;
    Access access = Access::service;
    bool asJSON = false;
};

/// Shows what the service reads from files. Returns the exit status: 1 when it could not read one.
int runInfo(const InfoOptions& options);

} // namespace tarn::tool
