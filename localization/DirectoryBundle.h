#pragma once

#include <filesystem>

#include "roles/Localization.h"

namespace tarn {

/// A bundle that is a folder, with a sub-folder such as "de.lproj" for each language. Which languages it has
/// is looked up once, when it is made.
class DirectoryBundle final : public Bundle {
public:
    DirectoryBundle(std::filesystem::path path, const Localization& localization);

    std::vector<std::string> localizations() const override { return localizations_; }
    std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                               const std::string& localization) const override;
    std::string localizedString(const std::string& key, const std::string& defaultValue,
                                const std::string& table) const override;

private:
    const std::filesystem::path path_;
    const Localization& localization_;
    const std::vector<std::string> localizations_;
};

/// The entries of the strings file at `path`; none when it is no regular file of at most 1 MiB, or cannot be
/// read as a strings file.
std::optional<Bundle::Strings> readStringsFileAt(const std::filesystem::path& path);

} // namespace tarn
