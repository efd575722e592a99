#pragma once

#include <cstdint>
#include <optional>

#include "decoder/ByteSource.h"

namespace tarn {

/// Where the audio of a RIFF file stands.
struct WavData {
    std::int64_t offset = 0;
    std::uint32_t size = 0; ///< as the header says; in a file of over 4 GiB that is another number
};

/// None for what is not a RIFF file, and for one without audio.
std::optional<WavData> findWavData(ByteSource& source);

/// How many bytes of audio a RIFF file's header says that there are, when that is more than there are: the
/// file was cut off. None for every other file, also for one whose writer could not know how long it would
/// become.
std::optional<std::int64_t> brokenWavPromise(ByteSource& source);

} // namespace tarn
