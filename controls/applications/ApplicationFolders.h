#pragma once

#include <filesystem>
#include <vector>

#include "localization/LanguageChoice.h"

namespace tarn {

/// The data folders that applications are installed in, the user's own first: XDG_DATA_HOME (without it
/// ~/.local/share), then those of XDG_DATA_DIRS (without it /usr/local/share and /usr/share). Paths that are
/// not absolute do not count.
std::vector<std::filesystem::path> applicationFoldersFromEnvironment(const EnvironmentLookup& environment);

} // namespace tarn
