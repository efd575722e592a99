#include "controls/applications/ApplicationFolders.h"

#include <algorithm>
#include <string_view>

namespace tarn {

std::vector<std::filesystem::path> applicationFoldersFromEnvironment(const EnvironmentLookup& environment) {
    std::string list = environment("XDG_DATA_HOME");
    if (list.empty())
        list = environment("HOME") + "/.local/share";
    const std::string systemFolders = environment("XDG_DATA_DIRS");
    list += ":" + (systemFolders.empty() ? "/usr/local/share:/usr/share" : systemFolders);

    std::vector<std::filesystem::path> folders;
    for (std::string_view rest = list; !rest.empty();) {
        const std::size_t end = std::min(rest.find(':'), rest.size());
        std::filesystem::path folder = rest.substr(0, end);
        rest.remove_prefix(std::min(end + 1, rest.size()));
        if (folder.is_absolute() && std::ranges::find(folders, folder) == folders.end())
            folders.push_back(std::move(folder));
    }
    return folders;
}

} // namespace tarn
