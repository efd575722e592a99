#pragma once

#include <filesystem>
#include <functional>
#include <string>
#include <vector>

namespace tarn::tool {

/// The audio files in a folder and in the folders below it, in natural order. Hidden files and folders are
/// left out; a folder that a link leads back to is entered once. `refused` is told of folders that cannot be
/// read.
std::vector<std::string>
audioFilesIn(const std::filesystem::path& folder,
             const std::function<void(const std::string& path, const std::string& reason)>& refused);

} // namespace tarn::tool
