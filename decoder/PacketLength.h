#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Ffmpeg.h"

namespace tarn {

/// How many frames the codec makes of `packet`, by what the packet itself says or by what is constant for its
/// codec. Containers tell it in milliseconds, or for whole packets only, or not at all. None when only
/// decoding can tell.
std::optional<std::int64_t> framesIn(const AVStream& stream, const AVPacket& packet);

} // namespace tarn
