#include "decoder/TtaLength.h"

#include "decoder/WorkLimit.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr int lengthOffset =
    14; // in the header that FFmpeg makes up: behind a signature, a format and a rate
constexpr int ttaHeaderSize = 22;
constexpr auto longestSearch = 2s; // of processor time; some hundredths of a second at 44.1 kHz

bool needsLength(const Container& container) {
    const AVCodecParameters& parameters = *container.stream().codecpar;
    return parameters.codec_id == AV_CODEC_ID_TTA && container.isNamed("matroska") &&
           parameters.extradata_size >= ttaHeaderSize;
}

bool decodes(Container& container, const AVPacket& packet) {
    const auto codec = container.openCodec();
    const FfmpegPointer<AVFrame> frame(av_frame_alloc());
    return codec && avcodec_send_packet(codec.get(), &packet) == 0 &&
           avcodec_receive_frame(codec.get(), frame.get()) == 0;
}

} // namespace

void tellTtaLength(Container& container, std::int64_t frames) {
    if (!needsLength(container))
        return;
    for (int i = 0; i < 4; ++i)
        container.stream().codecpar->extradata[lengthOffset + i] =
            static_cast<std::uint8_t>(frames >> (8 * i));
}

std::optional<std::int64_t> findTtaLength(Container& container, const AVPacket& last) {
    const std::int64_t duration = container.context().duration; // in microseconds
    if (!needsLength(container) || duration <= 0)
        return std::nullopt;
    const std::int64_t rate = container.stream().codecpar->sample_rate;
    const std::int64_t about = av_rescale(duration, rate, AV_TIME_BASE);
    const WorkLimit limit(longestSearch);
    // Behind silence, the end of the packet may seem to come some frames too early: so from above.
    for (std::int64_t frames = about + rate / 1000 + 1; frames >= about - rate / 1000 - 1 && !limit.over();
         --frames) {
        tellTtaLength(container, frames);
        if (decodes(container, last))
            return frames;
    }
    return std::nullopt;
}

} // namespace tarn
