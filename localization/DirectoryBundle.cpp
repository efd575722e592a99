#include "localization/DirectoryBundle.h"

#include <algorithm>
#include <system_error>
#include <utility>

#include "localization/BundleText.h"
#include "localization/StringsFile.h"
#include "system/RegularFile.h"

namespace tarn {

namespace {

namespace fs = std::filesystem;

constexpr const char* languageFolderSuffix = ".lproj";
constexpr std::size_t sizeLimit = 1 << 20;

std::vector<std::string> languagesIn(const fs::path& bundle) {
    std::vector<std::string> names;
    std::error_code error;
    fs::directory_iterator entry(bundle, error);
    for (; !error && entry != fs::directory_iterator(); entry.increment(error))
        if (entry->path().extension() == languageFolderSuffix)
            names.push_back(entry->path().stem());
    std::ranges::sort(names);
    return names;
}

} // namespace

DirectoryBundle::DirectoryBundle(fs::path path, const Localization& localization)
    : path_(std::move(path)), localization_(localization), localizations_(languagesIn(path_)) {}

std::optional<std::string> DirectoryBundle::pathForResource(const std::string& name, const std::string& type,
                                                            const std::string& localization) const {
    const fs::path path = path_ / (localization + languageFolderSuffix) / (name + "." + type);
    std::error_code error;
    return fs::exists(path, error) ? std::optional(path.string()) : std::nullopt;
}

std::string DirectoryBundle::localizedString(const std::string& key, const std::string& defaultValue,
                                             const std::string& table) const {
    return textOfBundle(*this, localization_, key, defaultValue, table);
}

std::optional<Bundle::Strings> readStringsFileAt(const fs::path& path) {
    const auto bytes = readRegularFile(path, sizeLimit);
    return bytes ? parseStringsFile(*bytes) : std::nullopt;
}

} // namespace tarn
