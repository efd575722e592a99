#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "decoder/ByteSource.h"

namespace tarn {

/// The comments of a FLAC or Ogg file: "KEY=text", any number for each key.
///
/// FFmpeg joins those of one key with ";" and loses where one ends: "AC;DC" may be one artist or two. So the
/// first one, which is the one that is meant, is read here.
class VorbisComments {
public:
    /// Those of a FLAC file, or of the first audio in an Ogg file; none in any other file.
    explicit VorbisComments(ByteSource& source);

    /// The first comment of that key, in whatever case it is written.
    std::optional<std::string> first(std::string_view key) const;

private:
    std::string block_;
};

} // namespace tarn
