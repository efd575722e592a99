#pragma once

#include <string>
#include <vector>

namespace tarn::tool {

struct InfoOptions {
    std::vector<std::string> paths;
    bool asJSON = false;
};

/// Shows what files say of themselves, read as the service reads them, which need not run for that. Returns
/// the exit status: 1 when one could not be read.
int runInfo(const InfoOptions& options);

} // namespace tarn::tool
