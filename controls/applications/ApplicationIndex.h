#pragma once

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "controls/applications/DesktopEntry.h"
#include "controls/applications/FileWatch.h"
#include "controls/applications/Metainfo.h"

namespace tarn {

/// What the data folders hold, as they were at one time. Entries of an earlier folder hide those of the same
/// name in later ones; what cannot be read is left out.
///
/// Reads desktop entries below "applications" and component metadata in "metainfo" and "appdata". Not bounded
/// by the folders but by constants: files of up to 1 MiB, 20,000 of them, folders four deep.
class ApplicationIndex {
public:
    explicit ApplicationIndex(const std::vector<std::filesystem::path>& dataFolders);

    /// Null when no such entry is installed.
    const DesktopEntry* desktopEntry(const std::string& name) const;

    /// Null when no such add-on is installed.
    const Metainfo* addon(const std::string& identifier) const;

    /// The desktop entry of a component: the one that its metadata names, or that is called like it; none
    /// when it is not installed.
    std::optional<std::string> desktopEntryOfComponent(const std::string& identifier) const;

    /// True while the folders and files are as they were read. Reads none of them.
    bool isCurrent() const;

private:
    using Time = std::filesystem::file_time_type;

    void readEntries(const std::filesystem::path& folder, const std::string& prefix, int depth);
    void readMetainfo(const std::filesystem::path& folder);
    void addEntry(const std::filesystem::path& file, const std::string& name);
    void addMetainfo(const std::filesystem::path& file);
    std::optional<std::string> read(const std::filesystem::path& file);
    std::vector<std::filesystem::directory_entry> list(const std::filesystem::path& folder);

    std::map<std::string, DesktopEntry> entries_;
    std::map<std::string, Metainfo> addons_;
    std::map<std::string, Metainfo> components_;
    std::map<std::filesystem::path, std::optional<Time>> times_; // tell of folders that were not there yet
    std::size_t filesLeft_ = 20'000;
    FileWatch watch_;
};

} // namespace tarn
