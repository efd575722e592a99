#pragma once

#include <functional>
#include <istream>
#include <string>
#include <vector>

namespace tarn::tool {

/// What is to be played, one file after the other, and what cannot be, with the reason.
struct Listing {
    struct Refusal {
        std::string name;
        std::string reason;
    };

    std::vector<std::string> files;
    std::vector<Refusal> refused;
};

/// Makes names into files: folders become the audio files in them, playlists (.m3u, .m3u8, .pls) their
/// entries, file: URLs their paths, and "-" the list that is read from `input`. A named file that is not
/// there is refused; those of folders and lists are not looked at.
Listing listFiles(const std::vector<std::string>& names, std::istream& input);

} // namespace tarn::tool
