#pragma once

#include <filesystem>
#include <string>

namespace tarn {

/// The number behind `key` in a file of /proc whose lines are "key: number ..."; 0 when it is not there.
long numberInProcFile(const std::filesystem::path& file, const std::string& key);

} // namespace tarn
