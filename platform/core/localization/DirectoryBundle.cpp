#include "platform/core/localization/DirectoryBundle.h"

#include <algorithm>
#include <system_error>
#include <utility>

#include "platform/core/RegularFile.h"
#include "platform/core/localization/LanguageChoice.h"
#include "platform/core/localization/StringsFile.h"

namespace tarn {

namespace {

namespace fs = std::filesystem;

constexpr const char* languageFolderSuffix = ".lproj";
constexpr const char* developmentLanguage = "en";
constexpr std::size_t sizeLimit = 1 << 20;

} // namespace

DirectoryBundle::DirectoryBundle(fs::path path, std::vector<std::string> preferredLanguages)
    : path_(std::move(path)), preferredLanguages_(std::move(preferredLanguages)) {}

std::vector<std::string> DirectoryBundle::localizations() const {
    std::vector<std::string> names;
    std::error_code error;
    fs::directory_iterator entry(path_, error);
    for (; !error && entry != fs::directory_iterator(); entry.increment(error))
        if (entry->path().extension() == languageFolderSuffix)
            names.push_back(entry->path().stem());
    std::ranges::sort(names);
    return names;
}

std::optional<std::string> DirectoryBundle::pathForResource(const std::string& name, const std::string& type,
                                                            const std::string& localization) const {
    const fs::path path = path_ / (localization + languageFolderSuffix) / (name + "." + type);
    std::error_code error;
    return fs::exists(path, error) ? std::optional(path.string()) : std::nullopt;
}

std::string DirectoryBundle::localizedString(const std::string& key, const std::string& defaultValue,
                                             const std::string& table) const {
    auto languages = choosePreferredLocalizations(localizations(), preferredLanguages_);
    languages.emplace_back(developmentLanguage);
    for (const std::string& language : languages) {
        const auto path = pathForResource(table, "strings", language);
        const auto strings = path ? readStringsFileAt(*path) : std::nullopt;
        if (!strings)
            continue;
        if (const auto entry = strings->find(key); entry != strings->end())
            return entry->second;
    }
    return defaultValue.empty() ? key : defaultValue;
}

std::optional<Bundle::Strings> readStringsFileAt(const fs::path& path) {
    const auto bytes = readRegularFile(path, sizeLimit);
    return bytes ? parseStringsFile(*bytes) : std::nullopt;
}

} // namespace tarn
