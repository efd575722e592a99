#pragma once

#include "decoder/Ffmpeg.h"
#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// How samples that the codec makes as `format` are handed out.
SampleFormat decodedSampleFormat(AVSampleFormat format);

/// Appends `count` frames of `frame`, from its frame `first` on, as `format` has them: its sample format is
/// that of decodedSampleFormat().
void appendInterleaved(const AVFrame& frame, int first, int count, const PcmFormat& format,
                       PcmBuffer& buffer);

} // namespace tarn
