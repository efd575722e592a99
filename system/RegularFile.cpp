#include "system/RegularFile.h"

#include <fstream>
#include <system_error>

namespace tarn {

std::optional<std::string> readRegularFile(const std::filesystem::path& path, std::size_t sizeLimit) {
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error))
        return std::nullopt;
    const std::uintmax_t size = std::filesystem::file_size(path, error);
    if (error || size > sizeLimit)
        return std::nullopt;
    std::ifstream file(path, std::ios::binary);
    std::string content(static_cast<std::size_t>(size), '\0');
    if (!file.read(content.data(), static_cast<std::streamsize>(size)))
        return std::nullopt;
    return content;
}

} // namespace tarn
