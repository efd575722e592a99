#include "sound/pulse/PulseLibrary.h"

namespace tarn {

extern "C" [[gnu::visibility("default")]] SoundLibrary* tarnSoundModule1() { return new PulseLibrary; }

} // namespace tarn
