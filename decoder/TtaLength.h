#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Container.h"

namespace tarn {

/// A TTA decoder cannot decode the last packet unless it knows how many frames there are in all. Matroska
/// tells milliseconds only, so that FFmpeg's guess is wrong by some frames, and up to a second is lost.
///
/// Does nothing for other codecs and containers.
void tellTtaLength(Container& container, std::int64_t frames);

/// The number near the container's duration with which `last`, the last packet, can be decoded. None for
/// other codecs and containers, and when there is no such number.
std::optional<std::int64_t> findTtaLength(Container& container, const AVPacket& last);

} // namespace tarn
