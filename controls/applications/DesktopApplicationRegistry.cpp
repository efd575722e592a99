#include "controls/applications/DesktopApplicationRegistry.h"

#include <cstdlib>
#include <utility>

#include "controls/applications/ApplicationFolders.h"

namespace tarn {

namespace {

std::optional<std::string> applicationOfAddon(const ApplicationIndex& index, const std::string& extension) {
    const Metainfo* addon = index.addon(extension);
    if (!addon || addon->extends.empty())
        return std::nullopt;
    for (const std::string& component : addon->extends)
        if (auto application = index.desktopEntryOfComponent(component))
            return application;
    return withoutDesktopSuffix(addon->extends.front());
}

/// The extension's own name counts with any number of parts, a shortened one with two at least.
std::optional<std::string> applicationByName(const ApplicationIndex& index, const std::string& extension) {
    if (index.desktopEntry(extension))
        return extension;
    std::string name = extension;
    for (std::size_t dot = name.rfind('.'); dot != name.npos; dot = name.rfind('.')) {
        name.resize(dot);
        if (name.find('.') == name.npos)
            break;
        if (index.desktopEntry(name))
            return name;
    }
    return std::nullopt;
}

} // namespace

DesktopApplicationRegistry::DesktopApplicationRegistry(std::vector<std::filesystem::path> dataFolders,
                                                       std::vector<std::string> languages)
    : dataFolders_(std::move(dataFolders)), languages_(std::move(languages)) {}

template <class Use>
auto DesktopApplicationRegistry::withCurrentIndex(Use&& use) {
    return index_.withLocked([&](std::optional<ApplicationIndex>& index) {
        if (!index || !index->isCurrent())
            index.emplace(dataFolders_);
        return std::forward<Use>(use)(std::as_const(*index));
    });
}

std::optional<std::string>
DesktopApplicationRegistry::applicationContainingExtension(const std::string& extensionIdentifier) {
    return withCurrentIndex([&](const ApplicationIndex& index) {
        auto application = applicationOfAddon(index, extensionIdentifier);
        return application ? application : applicationByName(index, extensionIdentifier);
    });
}

std::optional<std::string> DesktopApplicationRegistry::applicationName(const std::string& application) {
    return withCurrentIndex([&](const ApplicationIndex& index) -> std::optional<std::string> {
        const DesktopEntry* entry = index.desktopEntry(application);
        return entry ? nameInLanguages(*entry, languages_) : std::nullopt;
    });
}

std::unique_ptr<DesktopApplicationRegistry> systemApplicationRegistry(std::vector<std::string> languages) {
    auto folders = applicationFoldersFromEnvironment([](const char* name) {
        const char* value = std::getenv(name);
        return std::string(value ? value : "");
    });
    return std::make_unique<DesktopApplicationRegistry>(std::move(folders), std::move(languages));
}

} // namespace tarn
