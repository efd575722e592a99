#include "controls/applications/ApplicationIndex.h"

#include <algorithm>
#include <system_error>
#include <utility>

#include "system/RegularFile.h"

namespace tarn {

namespace {

namespace fs = std::filesystem;

constexpr std::size_t sizeLimit = 1 << 20;
constexpr int depthLimit = 4;

std::optional<fs::file_time_type> timeOfChange(const fs::path& folder) {
    std::error_code error;
    const auto time = fs::last_write_time(folder, error);
    return error ? std::nullopt : std::optional(time);
}

} // namespace

ApplicationIndex::ApplicationIndex(const std::vector<fs::path>& dataFolders) {
    for (const fs::path& folder : dataFolders) {
        readEntries(folder / "applications", "", 0);
        readMetainfo(folder / "metainfo");
        readMetainfo(folder / "appdata");
    }
}

const DesktopEntry* ApplicationIndex::desktopEntry(const std::string& name) const {
    const auto entry = entries_.find(name);
    return entry == entries_.end() || entry->second.isHidden ? nullptr : &entry->second;
}

const Metainfo* ApplicationIndex::addon(const std::string& identifier) const {
    const auto addon = addons_.find(identifier);
    return addon == addons_.end() ? nullptr : &addon->second;
}

std::optional<std::string> ApplicationIndex::desktopEntryOfComponent(const std::string& identifier) const {
    if (const auto component = components_.find(identifier); component != components_.end())
        for (const std::string& name : component->second.desktopEntries)
            if (desktopEntry(name))
                return name;
    for (const std::string& name : {withoutDesktopSuffix(identifier), identifier})
        if (desktopEntry(name))
            return name;
    return std::nullopt;
}

bool ApplicationIndex::isCurrent() const {
    return !watch_.sawChange() && std::ranges::all_of(times_, [](const auto& stamp) {
        return timeOfChange(stamp.first) == stamp.second;
    });
}

void ApplicationIndex::readEntries(const fs::path& folder, const std::string& prefix, int depth) {
    for (const fs::directory_entry& entry : list(folder)) {
        const std::string name = entry.path().filename();
        std::error_code error;
        if (entry.is_directory(error) && !entry.is_symlink(error)) {
            if (depth + 1 < depthLimit)
                readEntries(entry.path(), prefix + name + "-", depth + 1);
        } else if (name.ends_with(".desktop")) {
            addEntry(entry.path(), prefix + withoutDesktopSuffix(name));
        }
    }
}

void ApplicationIndex::readMetainfo(const fs::path& folder) {
    for (const fs::directory_entry& entry : list(folder))
        if (entry.path().extension() == ".xml")
            addMetainfo(entry.path());
}

void ApplicationIndex::addEntry(const fs::path& file, const std::string& name) {
    if (entries_.contains(name))
        return;
    const auto text = read(file);
    if (auto entry = text ? parseDesktopEntry(*text) : std::nullopt)
        entries_.emplace(name, std::move(*entry));
}

void ApplicationIndex::addMetainfo(const fs::path& file) {
    const auto xml = read(file);
    auto metainfo = xml ? parseMetainfo(*xml) : std::nullopt;
    if (!metainfo)
        return;
    auto& components = metainfo->isAddon ? addons_ : components_;
    std::string identifier = metainfo->identifier;
    components.emplace(std::move(identifier), std::move(*metainfo));
}

std::optional<std::string> ApplicationIndex::read(const fs::path& file) {
    std::error_code error;
    if (fs::is_symlink(file, error))
        watch_.add(file); // its folder does not tell of what it leads to
    return readRegularFile(file, sizeLimit);
}

/// In the order of their names, so that the outcome does not depend on the file system. Watches before it
/// reads, so that a change meanwhile is seen the next time.
std::vector<fs::directory_entry> ApplicationIndex::list(const fs::path& folder) {
    watch_.add(folder);
    times_.emplace(folder, timeOfChange(folder));
    std::vector<fs::directory_entry> entries;
    std::error_code error;
    fs::directory_iterator entry(folder, error);
    for (; !error && entry != fs::directory_iterator() && filesLeft_ > 0; entry.increment(error)) {
        entries.push_back(*entry);
        --filesLeft_;
    }
    std::ranges::sort(entries);
    return entries;
}

} // namespace tarn
