#pragma once

#include <cstdint>
#include <optional>

#include "decoder/ByteSource.h"

namespace tarn {

/// How many bytes of audio a RIFF file's header says that there are, when that is more than there are: the
/// file was cut off. None for every other file, also for one whose writer could not know how long it would
/// become.
std::optional<std::int64_t> brokenWavPromise(ByteSource& source);

} // namespace tarn
