#pragma once

#include "decoder/ByteSource.h"
#include "decoder/Ffmpeg.h"

namespace tarn {

/// The demuxer for a file by the signature that it begins with. Null when there is none that is beyond doubt:
/// then FFmpeg has to ask all its demuxers, which takes as long as opening the file.
const AVInputFormat* knownFormat(ByteSource& source);

} // namespace tarn
