#pragma once

#include <cstdint>

#include "roles/Error.h"

namespace tarn {

/// Why nothing is heard: the error of a queue player that could not begin to sound, goes on without sound, or
/// was paused because of its device.
inline constexpr char soundErrorDomain[] = "ostrel.tarnd.sound";

/// Clients see these numbers; they stay as they are.
enum class SoundErrorCode : std::int64_t {
    noServer = 1,   ///< no sound server runs, or it does not answer
    noDevice = 2,   ///< the sound server has nothing to play on
    deviceGone = 3, ///< the device that sounded is gone, and playback was paused
};

/// With texts for a person.
Error soundError(SoundErrorCode code);

} // namespace tarn
