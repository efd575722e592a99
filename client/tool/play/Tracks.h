#pragma once

#include <functional>
#include <string>
#include <vector>

#include <tarn/Client.h>

namespace tarn::tool {

/// A file as the service knows it.
struct Track {
    std::string path;
    std::string identifier; // of its asset and of its item
    client::AssetInfo info;

    /// The title, or the file's name.
    std::string title() const;
};

enum class Access { service, granted };

/// Makes an asset of each file, anew when the service forgets them meanwhile, those that the service can
/// read; tells the others with the reason. A file is opened here and granted when the service has no right of
/// its own to it.
std::vector<Track>
openTracks(client::Client& client, const std::vector<std::string>& paths, Access access,
           const std::function<void(const std::string& path, const std::string& reason)>& refused);

} // namespace tarn::tool
