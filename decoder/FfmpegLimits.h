#pragma once

namespace tarn {

/// Keeps FFmpeg from single huge allocations and from the log. Once, before anything else of it is used.
void setFfmpegLimits();

} // namespace tarn
