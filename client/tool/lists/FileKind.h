#pragma once

#include <string_view>

namespace tarn::tool {

/// What a file seems to be by the end of its name. Of a folder only the audio files are played; a file that
/// is named is always tried.
enum class FileKind { audio, playlist, other };

FileKind fileKindOf(std::string_view name);

} // namespace tarn::tool
