#pragma once

#include "decoder/Decoder.h"

namespace tarn {

/// Opens `source` and finds out all of AudioFileInfo. Reads packets to the end where the container only
/// guesses how long it is.
DecoderModule::Examined examineFile(ByteSource& source);

} // namespace tarn
