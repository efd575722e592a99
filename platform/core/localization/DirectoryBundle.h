#pragma once

#include <filesystem>

#include "platform/Localization.h"

namespace tarn {

/// A bundle that is a folder, with a sub-folder such as "de.lproj" for each language.
///
/// Its own choice of language is the user's, in order of preference; English where that has no text.
class DirectoryBundle final : public Bundle {
public:
    DirectoryBundle(std::filesystem::path path, std::vector<std::string> preferredLanguages);

    std::vector<std::string> localizations() const override;
    std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                               const std::string& localization) const override;
    std::string localizedString(const std::string& key, const std::string& defaultValue,
                                const std::string& table) const override;

private:
    const std::filesystem::path path_;
    const std::vector<std::string> preferredLanguages_;
};

/// The entries of the strings file at `path`; none when it is no regular file of at most 1 MiB, or cannot be
/// read as a strings file.
std::optional<Bundle::Strings> readStringsFileAt(const std::filesystem::path& path);

} // namespace tarn
