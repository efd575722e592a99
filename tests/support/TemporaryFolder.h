#pragma once

#include <filesystem>
#include <string>
#include <string_view>

namespace tarn {

/// An empty folder that goes away, with all that is in it, at the end of the scope.
class TemporaryFolder final {
public:
    TemporaryFolder();
    ~TemporaryFolder();

    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;

    const std::filesystem::path& path() const { return path_; }
    std::filesystem::path operator/(std::string_view name) const { return path_ / name; }

    /// Writes a file, with the folders that lead to it, and returns its path.
    std::filesystem::path write(std::string_view name, std::string_view content) const;

private:
    std::filesystem::path path_;
};

/// All bytes of a file; none when it cannot be read.
std::string contentOf(const std::filesystem::path& file);

} // namespace tarn
