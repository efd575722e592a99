#pragma once

#include <cstdint>
#include <optional>

#include "decoder/ByteSource.h"

namespace tarn {

/// About how many samples the MPEG or ADTS frames hold that begin at byte `begin`, from a look at 64 places
/// of the file: the bit rate at its beginning alone says little about one that changes its rate. None when
/// hardly any of these places holds frames.
std::optional<std::int64_t> estimateMpegSamples(ByteSource& source, std::int64_t begin);

} // namespace tarn
