#include "decoder/FfmpegLimits.h"

#include "decoder/Ffmpeg.h"

namespace tarn {

namespace {

constexpr std::size_t largestAllocation = 64u << 20;

}

void setFfmpegLimits() {
    av_max_alloc(largestAllocation);
    av_log_set_level(AV_LOG_QUIET); // what a broken file provokes is told by our own errors
}

} // namespace tarn
