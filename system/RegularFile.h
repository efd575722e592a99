#pragma once

#include <cstddef>
#include <filesystem>
#include <optional>
#include <string>

namespace tarn {

/// The content of a file that other programs have written; none when it is no regular file (a pipe would
/// never end) or holds more than `sizeLimit` bytes, or cannot be read.
std::optional<std::string> readRegularFile(const std::filesystem::path& path, std::size_t sizeLimit);

} // namespace tarn
