#pragma once

#include "decoder/ByteSource.h"

namespace tarn {

/// Might the samples of this WAV file be something else: DTS, AC-3 or MPEG frames, which a CD player would
/// hand on to an amplifier? Played as samples they are loud noise. FFmpeg finds out for certain, but asks all
/// its demuxers for each of the first 32 packets, which takes 5 ms; this look takes a hundredth of that, and
/// is wrong only in that it may suspect plain samples.
bool mayBeCodedAudio(ByteSource& source);

} // namespace tarn
