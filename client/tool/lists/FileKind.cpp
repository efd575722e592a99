#include "client/tool/lists/FileKind.h"

#include <algorithm>
#include <array>
#include <string>

namespace tarn::tool {

namespace {

// Files that hold videos as a rule, such as .mp4 and .mkv, are left out.
constexpr std::array<std::string_view, 24> audioEndings = {
    "aac", "aif", "aifc", "aiff", "ape",  "au",  "caf", "flac", "m4a", "m4b",  "mka",  "mp1",
    "mp2", "mp3", "oga",  "ogg",  "opus", "snd", "tta", "w64",  "wav", "wave", "weba", "wv"};

constexpr std::array<std::string_view, 3> playlistEndings = {"m3u", "m3u8", "pls"};

} // namespace

FileKind fileKindOf(std::string_view name) {
    const auto dot = name.find_last_of("./");
    if (dot == std::string_view::npos || name[dot] == '/' || dot == 0 || name[dot - 1] == '/')
        return FileKind::other;
    std::string ending(name.substr(dot + 1));
    std::transform(ending.begin(), ending.end(), ending.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    const auto isIn = [&](const auto& endings) {
        return std::find(endings.begin(), endings.end(), ending) != endings.end();
    };
    return isIn(audioEndings)      ? FileKind::audio
           : isIn(playlistEndings) ? FileKind::playlist
                                   : FileKind::other;
}

} // namespace tarn::tool
