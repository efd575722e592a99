#include "client/tool/lists/Listing.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <iterator>
#include <string_view>
#include <system_error>
#include <utility>

#include "client/tool/lists/FileKind.h"
#include "client/tool/lists/FolderWalk.h"
#include "client/tool/lists/Playlist.h"
#include "media/FileURL.h"
#include "system/RegularFile.h"

namespace tarn::tool {

namespace {

namespace fs = std::filesystem;

constexpr std::size_t longestPlaylist = 64U << 20U;

/// "http://..." and "file:...": a scheme and no path. A file of such a name is given as "./http:...".
bool isURL(const std::string& name) {
    const auto end = std::find_if_not(name.begin(), name.end(), [](unsigned char letter) {
        return std::isalnum(letter) != 0 || letter == '+' || letter == '-' || letter == '.';
    });
    const std::string_view rest(end, name.end());
    return name.starts_with("file:") || (end != name.begin() && rest.starts_with("://"));
}

class Lister {
public:
    explicit Lister(std::istream& input) : input_(input) {}

    void addNamed(const std::string& name) {
        if (name == "-")
            return addEntries(std::string(std::istreambuf_iterator<char>(input_), {}), "");
        add(name);
    }

    Listing take() { return std::move(listing_); }

private:
    void add(const std::string& name) {
        if (!isURL(name))
            return addPath(name);
        if (const auto path = pathFromFileURL(name))
            return addPath(*path);
        refuse(name, "only files of this device can be played");
    }

    void addPath(const std::string& path) {
        std::error_code problem;
        const auto status = fs::status(path, problem);
        if (!fs::exists(status))
            return refuse(path, problem ? problem.message() : "No such file or directory");
        if (fs::is_directory(status))
            return addFolder(path);
        if (fileKindOf(path) == FileKind::playlist)
            return addPlaylist(path);
        listing_.files.push_back(path);
    }

    void addFolder(const std::string& folder) {
        bool readable = true;
        auto files = audioFilesIn(folder, [&](const std::string& path, const std::string& reason) {
            readable = false;
            refuse(path, reason);
        });
        if (files.empty() && readable)
            refuse(folder, "there are no audio files in this folder");
        std::move(files.begin(), files.end(), std::back_inserter(listing_.files));
    }

    void addPlaylist(const std::string& path) {
        std::error_code ignored;
        const auto identity = fs::canonical(path, ignored);
        if (std::find(inside_.begin(), inside_.end(), identity) != inside_.end())
            return refuse(path, "this playlist is in itself");
        const auto text = readRegularFile(path, longestPlaylist);
        if (!text)
            return refuse(path, "it cannot be read");
        inside_.push_back(identity);
        addEntries(*text, fs::path(path).parent_path());
        inside_.pop_back();
    }

    /// Relative names are taken from `folder`.
    void addEntries(const std::string& text, const fs::path& folder) {
        for (const auto& entry : playlistEntries(text)) {
            if (isURL(entry)) {
                add(entry);
                continue;
            }
            auto path = (folder / entry).string();
            std::error_code ignored;
            if (entry.find('\\') != std::string::npos && !fs::exists(path, ignored)) { // from another system
                path = entry;
                std::replace(path.begin(), path.end(), '\\', '/');
                path = (folder / path).string();
            }
            // A long list is not looked at file by file before the first of them sounds.
            if (fileKindOf(path) == FileKind::audio)
                listing_.files.push_back(path);
            else
                addPath(path);
        }
    }

    void refuse(const std::string& name, const std::string& reason) {
        listing_.refused.push_back({name, reason});
    }

    std::istream& input_;
    std::vector<fs::path> inside_; // the playlists that are being read
    Listing listing_;
};

} // namespace

Listing listFiles(const std::vector<std::string>& names, std::istream& input) {
    Lister lister(input);
    for (const auto& name : names)
        lister.addNamed(name);
    return lister.take();
}

} // namespace tarn::tool
