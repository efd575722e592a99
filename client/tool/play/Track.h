#pragma once

#include <cstddef>
#include <string>

#include <tarn/Client.h>

namespace tarn::tool {

/// Who opens the files: the service with rights of its own, or this program, which hands them over.
enum class Access { service, granted };

/// A file as the service knows it.
struct Track {
    std::string path;
    std::string identifier; // of its asset and of its item
    std::size_t file = 0;   // its place in the list
    std::size_t number = 0; // whose turn it is, from 1
    client::AssetInfo info;

    /// The title, or the file's name.
    std::string title() const;
};

} // namespace tarn::tool
