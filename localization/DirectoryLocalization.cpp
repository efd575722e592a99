#include "localization/DirectoryLocalization.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>
#include <utility>

#include "localization/DirectoryBundle.h"
#include "localization/LanguageChoice.h"

namespace tarn {

namespace {

namespace fs = std::filesystem;

/// "share/tarn" stands beside the folder of the program, in the build tree and wherever it is installed.
std::string systemErrorBundlePath() {
    constexpr const char* bundle = "tarn/errors.bundle";
    std::error_code error;
    const fs::path program = fs::read_symlink("/proc/self/exe", error);
    const fs::path besideProgram = program.parent_path().parent_path() / "share" / bundle;
    return fs::is_directory(besideProgram, error) ? besideProgram : fs::path(TARN_DATA_FOLDER) / bundle;
}

std::string environmentVariable(const char* name) {
    const char* value = std::getenv(name);
    return value ? value : "";
}

template <class Value>
std::optional<Value> known(const MutexProtected<std::map<std::string, Value>>& values,
                           const std::string& path) {
    return values.withLocked([&](const auto& map) {
        const auto entry = map.find(path);
        return entry == map.end() ? std::nullopt : std::optional(entry->second);
    });
}

} // namespace

DirectoryLocalization::DirectoryLocalization(std::string errorBundlePath,
                                             std::vector<std::string> preferredLanguages)
    : errorBundlePath_(std::move(errorBundlePath)), preferredLanguages_(std::move(preferredLanguages)) {}

std::shared_ptr<const Bundle> DirectoryLocalization::openBundle(const std::string& path) const {
    if (auto open = known(openBundles_, path))
        return *open;
    std::error_code error;
    if (!fs::is_directory(path, error))
        return nullptr;
    const auto bundle = std::make_shared<const DirectoryBundle>(path, *this);
    openBundles_.withLocked([&](auto& bundles) { bundles.insert_or_assign(path, bundle); });
    return bundle;
}

bool DirectoryLocalization::fileExists(const std::string& path) const {
    std::error_code error;
    return fs::exists(path, error);
}

std::optional<Bundle::Strings> DirectoryLocalization::readStringsFile(const std::string& path) const {
    if (auto file = known(readFiles_, path))
        return file;
    auto strings = readStringsFileAt(path);
    if (strings)
        readFiles_.withLocked([&](auto& files) { files.insert_or_assign(path, *strings); });
    return strings;
}

std::vector<std::string>
DirectoryLocalization::preferredLocalizations(const std::vector<std::string>& localizations,
                                              const std::vector<std::string>& preferences) const {
    return choosePreferredLocalizations(localizations, preferences);
}

std::unique_ptr<Localization> systemLocalization() {
    return std::make_unique<DirectoryLocalization>(systemErrorBundlePath(),
                                                   languagesFromEnvironment(environmentVariable));
}

} // namespace tarn
