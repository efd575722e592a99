#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "decoder/Ffmpeg.h"

namespace tarn {

/// A tag's text made fit for people: valid UTF-8 (bytes that are not are taken for Latin-1 where all of the
/// text looks like it, else replaced), no control characters, no blank ends, cut to at most 1,024 bytes.
std::string repairTagText(std::string_view raw);

/// The file's own tag, or its audio stream's; none when both are absent or blank.
std::optional<std::string> readTag(const AVFormatContext& context, const AVStream& stream, const char* key);

} // namespace tarn
