#include "sound/SoundError.h"

namespace tarn {

Error soundError(SoundErrorCode code) {
    struct Texts {
        const char* description;
        const char* reason;
    };
    static constexpr Texts texts[] = {
        {"There is no sound server.", "Start PulseAudio or PipeWire with pipewire-pulse; in Debian, the "
                                      "package pipewire-audio brings all of it."},
        {"There is no sound device.",
         "The sound server has nothing to play on: connect a device or turn one on."},
        {"The sound device is gone.", "Playback was paused so that it does not go on over another device."},
    };
    const auto& [description, reason] = texts[static_cast<std::size_t>(code) - 1];
    return {soundErrorDomain,
            static_cast<std::int64_t>(code),
            {{localizedDescriptionKey, description}, {localizedFailureReasonKey, reason}}};
}

} // namespace tarn
