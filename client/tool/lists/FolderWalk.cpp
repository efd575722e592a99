#include "client/tool/lists/FolderWalk.h"

#include <sys/stat.h>

#include <algorithm>
#include <set>
#include <system_error>
#include <utility>

#include "client/tool/lists/FileKind.h"
#include "client/tool/lists/NaturalOrder.h"

namespace tarn::tool {

namespace {

namespace fs = std::filesystem;

using Refused = std::function<void(const std::string&, const std::string&)>;

class FolderWalk {
public:
    explicit FolderWalk(const Refused& refused) : refused_(refused) {}

    void enter(const fs::path& folder) {
        struct stat status {};
        if (::stat(folder.c_str(), &status) == 0 && !entered_.emplace(status.st_dev, status.st_ino).second)
            return;
        for (const auto& entry : sortedEntries(folder)) {
            if (entry.isFolder)
                enter(folder / entry.name);
            else
                files_.push_back((folder / entry.name).string());
        }
    }

    std::vector<std::string> takeFiles() { return std::move(files_); }

private:
    struct Entry {
        std::string name;
        bool isFolder;
    };

    std::vector<Entry> sortedEntries(const fs::path& folder) const {
        std::vector<Entry> entries;
        std::error_code problem;
        for (fs::directory_iterator at(folder, problem); !problem && at != fs::directory_iterator();
             at.increment(problem)) {
            auto name = at->path().filename().string();
            std::error_code unknown; // what cannot be looked at is no folder
            const bool isFolder = at->is_directory(unknown);
            if (!name.starts_with('.') && (isFolder || fileKindOf(name) == FileKind::audio))
                entries.push_back({std::move(name), isFolder});
        }
        if (problem)
            refused_(folder.string(), problem.message());
        std::sort(entries.begin(), entries.end(),
                  [](const Entry& a, const Entry& b) { return comesBefore(a.name, b.name); });
        return entries;
    }

    const Refused& refused_;
    std::set<std::pair<dev_t, ino_t>> entered_;
    std::vector<std::string> files_;
};

} // namespace

std::vector<std::string> audioFilesIn(const fs::path& folder, const Refused& refused) {
    FolderWalk walk(refused);
    walk.enter(folder);
    return walk.takeFiles();
}

} // namespace tarn::tool
